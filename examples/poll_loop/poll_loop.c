/* Follows every node and adapter of the cluster and prints what happens to them: poll_loop [EVENTS] */
#define _POSIX_C_SOURCE 200809L

#include <errno.h>
#include <hb_client.h>
#include <poll.h>
#include <signal.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

enum { MAX_DESCRIPTORS = 16 };

/* The record is large; it belongs into static storage or on the heap. */
static Hb_Group group;

static int fail(const char* operation) {
  fprintf(stderr, "poll_loop: %s failed with error %d, see hb_get_errno(3)\n", operation, hb_get_errno());
  if (hb_get_errno() == HB_ECONNECT) {
    fprintf(stderr, "poll_loop: no daemon answers; start one with: hbd\n");
  }
  return EXIT_FAILURE;
}

static const char* event_text(Hb_Events events) {
  switch (events) {
    case HB_EVENT_DEATH:
      return "left";
    case HB_EVENT_JOIN:
      return "joined";
    case HB_EVENT_NEW_GROUP:
      return "group is";
    case HB_EVENT_CONFIGURATION:
      return "configuration changed";
    default:
      return "other event";
  }
}

static void print_members(void) {
  Hb_Adapter_Identifier adapter;
  Hb_Node_Number node;
  Hb_Rc rc;

  if (group.Hb_group_type == Hb_Adapter_Group) {
    for (rc = hb_get_first_adapter(&group, &adapter); rc == Hb_Success; rc = hb_get_next_adapter(&group, &adapter)) {
      printf(" adapter %u", (unsigned)adapter.Hb_adapter_number);
    }
  } else if (group.Hb_group_type == Hb_Node_Group) {
    for (rc = hb_get_first_node(&group, &node); rc == Hb_Success; rc = hb_get_next_node(&group, &node)) {
      printf(" node %d", node);
    }
  }
}

static void print_event(Hb_Events events, const char* name, Hb_Seq_Num sequence) {
  printf("%u %s: %s", (unsigned)sequence, name, event_text(events));
  if (events == HB_EVENT_DEATH || events == HB_EVENT_JOIN || events == HB_EVENT_NEW_GROUP) {
    print_members();
  }
  printf("\n");
  fflush(stdout);
}

/* 0 when everything is subscribed to, otherwise the exit status. */
static int subscribe(void) {
  static Hb_Subscription_Group nodes;
  static Hb_Subscription_Group adapters;
  char node_name[] = "nodes";
  char adapter_name[] = "adapters";
  const int events = HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP;

  if (hb_init() != Hb_Success) {
    return fail("hb_init");
  }
  if (hb_add_all_nodes_to_subscription_group(&nodes) != Hb_Success ||
      hb_subscribe(node_name, &nodes, events) != Hb_Success) {
    return fail("subscribing to nodes");
  }
  if (hb_add_all_adapters_to_subscription_group(&adapters) != Hb_Success ||
      hb_subscribe(adapter_name, &adapters, events) != Hb_Success) {
    return fail("subscribing to adapters");
  }
  return 0;
}

/* Waits until at least one descriptor is ready; `ready` receives those that are, and a closing -1. */
static int wait_for_input(const int* descriptors, int count, int* ready) {
  struct pollfd polled[MAX_DESCRIPTORS];
  int i;

  for (i = 0; i < count; i++) {
    polled[i].fd = descriptors[i];
    polled[i].events = POLLIN;
    polled[i].revents = 0;
  }
  while (poll(polled, (nfds_t)count, -1) < 0) {
    if (errno != EINTR) {
      fprintf(stderr, "poll_loop: poll: %s\n", strerror(errno));
      return -1;
    }
  }
  for (i = 0; i < count; i++) {
    if (polled[i].revents != 0) {
      *ready++ = polled[i].fd;
    }
  }
  *ready = -1;
  return 0;
}

/* 1 for an event, 0 for none, -1 when there will be no more. */
static int take_event(int* ready) {
  struct timeval now = {0, 0};
  Hb_Events events;
  Hb_Name name;
  Hb_Seq_Num sequence;

  if (hb_get_event_message(ready, &now, &events, name, &group, &sequence) == Hb_Success) {
    print_event(events, name, sequence);
    return 1;
  }
  /* Nothing whole to read yet, or a packet that was no event: both leave the connection usable. */
  if (hb_get_errno() == HB_ENOTREADY || hb_get_errno() == HB_EBADREPLY) {
    return 0;
  }
  return -1;
}

static int follow(const int* descriptors, int count, long limit) {
  int ready[MAX_DESCRIPTORS + 1];
  long seen = 0;

  while (limit == 0 || seen < limit) {
    int taken;

    if (wait_for_input(descriptors, count, ready) != 0) {
      return EXIT_FAILURE;
    }
    taken = take_event(ready);
    if (taken < 0) {
      return fail("hb_get_event_message");
    }
    seen += taken;
  }
  return EXIT_SUCCESS;
}

int main(int argc, char** argv) {
  const long limit = argc > 1 ? strtol(argv[1], NULL, 10) : 0;
  int* descriptors = NULL;
  int count = 0;
  int status;

  /* A daemon that went away must show as an error number, not as a signal. */
  signal(SIGPIPE, SIG_IGN);
  status = subscribe();
  if (status != 0) {
    return status;
  }
  if (hb_get_file_descriptor_array(&descriptors, &count) != Hb_Success || count > MAX_DESCRIPTORS) {
    return fail("hb_get_file_descriptor_array");
  }
  status = follow(descriptors, count, limit);
  hb_free_file_descriptor_array(descriptors);
  hb_terminate();
  return status;
}
