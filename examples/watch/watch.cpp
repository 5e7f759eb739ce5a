// Follows nodes of the cluster and all of its adapters: watch [COUNT [NODE...]]
//
// COUNT is the number of events to end after, 0 for no end; without NODEs every node is followed.
#include <hb_client.h>
#include <poll.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <iostream>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace {

constexpr int followed_events = HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP;

// What the library's C interface reports by result and error number, as an exception.
class Client_error : public std::runtime_error {
 public:
  explicit Client_error(const std::string& operation)
      : std::runtime_error(operation + " failed with error " + std::to_string(hb_get_errno()) +
                           ", see hb_get_errno(3)") {}
};

void check(Hb_Rc rc, const char* operation) {
  if (rc != Hb_Success) {
    throw Client_error(operation);
  }
}

// A started client; it is stopped when this goes out of scope.
class Client {
 public:
  Client() { check(hb_init(), "hb_init"); }
  ~Client() { hb_terminate(); }
  Client(const Client&) = delete;
  Client& operator=(const Client&) = delete;
};

// The library's descriptors, ready for poll().
std::vector<pollfd> descriptors() {
  int* array = nullptr;
  int count = 0;
  check(hb_get_file_descriptor_array(&array, &count), "hb_get_file_descriptor_array");
  std::vector<pollfd> polled;
  for (int i = 0; i < count; ++i) {
    polled.push_back({array[i], POLLIN, 0});
  }
  hb_free_file_descriptor_array(array);
  return polled;
}

void subscribe(std::string name, Hb_Subscription_Group& group) {
  check(hb_subscribe(name.data(), &group, followed_events), "hb_subscribe");
}

void subscribe_to_nodes(const std::vector<Hb_Node_Number>& nodes) {
  auto group = std::make_unique<Hb_Subscription_Group>();
  if (nodes.empty()) {
    check(hb_add_all_nodes_to_subscription_group(group.get()), "hb_add_all_nodes_to_subscription_group");
  } else {
    check(hb_empty_subscription_group(group.get()), "hb_empty_subscription_group");
  }
  for (const Hb_Node_Number node : nodes) {
    check(hb_add_node_to_subscription_group(group.get(), node), "hb_add_node_to_subscription_group");
  }
  subscribe("nodes", *group);
}

void subscribe_to_adapters() {
  auto group = std::make_unique<Hb_Subscription_Group>();
  check(hb_add_all_adapters_to_subscription_group(group.get()), "hb_add_all_adapters_to_subscription_group");
  subscribe("adapters", *group);
}

// Waits for input and returns the descriptors that have some, with the -1 that the library expects at the end.
std::vector<int> wait_for_input(std::vector<pollfd>& polled) {
  while (poll(polled.data(), polled.size(), -1) < 0) {
    if (errno != EINTR) {
      throw std::system_error(errno, std::generic_category(), "poll");
    }
  }
  std::vector<int> ready;
  for (const pollfd& entry : polled) {
    if (entry.revents != 0) {
      ready.push_back(entry.fd);
    }
  }
  ready.push_back(-1);
  return ready;
}

struct Event {
  Hb_Events events = HB_EVENT_NONE;
  Hb_Name name = {};
  Hb_Seq_Num sequence = 0;
  Hb_Group group = {};
};

// True when there was an event. A packet that was none, or is not whole yet, leaves the connection usable.
bool take(std::vector<int> ready, Event& event) {
  timeval no_wait = {};
  const Hb_Rc rc =
      hb_get_event_message(ready.data(), &no_wait, &event.events, event.name, &event.group, &event.sequence);
  if (rc == Hb_Success) {
    return true;
  }
  if (hb_get_errno() != HB_ENOTREADY && hb_get_errno() != HB_EBADREPLY) {
    throw Client_error("hb_get_event_message");
  }
  return false;
}

std::string_view text(Hb_Events events) {
  switch (events) {
    case HB_EVENT_DEATH:
      return "left:";
    case HB_EVENT_JOIN:
      return "joined:";
    case HB_EVENT_NEW_GROUP:
      return "members:";
    case HB_EVENT_CONFIGURATION:
      return "the configuration changed";
    default:
      return "another event";
  }
}

void print_members(Hb_Group& group) {
  if (group.Hb_group_type == Hb_Node_Group) {
    Hb_Node_Number node = HB_NO_NODE;
    for (Hb_Rc rc = hb_get_first_node(&group, &node); rc == Hb_Success; rc = hb_get_next_node(&group, &node)) {
      std::cout << ' ' << node;
    }
  } else if (group.Hb_group_type == Hb_Adapter_Group) {
    Hb_Adapter_Identifier adapter = {};
    for (Hb_Rc rc = hb_get_first_adapter(&group, &adapter); rc == Hb_Success;
         rc = hb_get_next_adapter(&group, &adapter)) {
      std::cout << ' ' << adapter.Hb_adapter_number << (adapter.Hb_died_because_removed == Hb_True ? " (removed)" : "");
    }
  }
}

void print(Event& event) {
  std::cout << '#' << event.sequence << ' ' << event.name << ' ' << text(event.events);
  if ((event.events & followed_events) != 0) {
    print_members(event.group);
  }
  std::cout << std::endl;
}

void follow(long count) {
  std::vector<pollfd> polled = descriptors();
  auto event = std::make_unique<Event>();
  for (long seen = 0; count == 0 || seen < count;) {
    if (take(wait_for_input(polled), *event)) {
      print(*event);
      ++seen;
    }
  }
}

}  // namespace

int main(int argc, char** argv) try {
  const std::vector<std::string> arguments(argv + 1, argv + argc);
  std::vector<Hb_Node_Number> nodes;
  for (std::size_t i = 1; i < arguments.size(); ++i) {
    nodes.push_back(static_cast<Hb_Node_Number>(std::stoi(arguments[i])));
  }
  // A daemon that went away must show as an error number, not as a signal.
  std::signal(SIGPIPE, SIG_IGN);

  const Client client;
  subscribe_to_nodes(nodes);
  subscribe_to_adapters();
  follow(arguments.empty() ? 0 : std::stol(arguments[0]));
  return EXIT_SUCCESS;
} catch (const std::exception& error) {
  std::cerr << "watch: " << error.what() << '\n';
  if (hb_get_errno() == HB_ECONNECT) {
    std::cerr << "watch: no daemon answers; start one with: hbd\n";
  }
  return EXIT_FAILURE;
}
