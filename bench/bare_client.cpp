#include "bare_client.h"

#include <poll.h>
#include <sys/select.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <sys/un.h>

#include <cstring>
#include <stdexcept>

#include "hb_protocol/framing.h"

namespace bench {
namespace {

void set_buffers(int descriptor) {
  const int size = HB_SOCKET_BUFFER_SIZE;
  if (setsockopt(descriptor, SOL_SOCKET, SO_SNDBUF, &size, sizeof size) != 0) throw_errno("setsockopt");
  if (setsockopt(descriptor, SOL_SOCKET, SO_RCVBUF, &size, sizeof size) != 0) throw_errno("setsockopt");
}

void read_or_throw(int descriptor, void* bytes, size_t size) {
  if (!read_all(descriptor, static_cast<char*>(bytes), size)) throw std::runtime_error("the feed ended");
}

void wait_with_select(int descriptor, int seconds) {
  fd_set reading;
  fd_set writing;
  fd_set exceptional;
  FD_ZERO(&reading);
  FD_ZERO(&writing);
  FD_ZERO(&exceptional);
  FD_SET(descriptor, &reading);
  timeval time{seconds, 0};
  if (select(FD_SETSIZE, &reading, &writing, &exceptional, &time) != 1) throw_errno("select");
}

void wait_with_poll(int descriptor, int seconds) {
  pollfd entry{descriptor, POLLIN, 0};
  if (poll(&entry, 1, seconds * 1000) != 1) throw_errno("poll");
}

// What every event hands out.
void copy_header(const client_packet* packet, Outputs& outputs, Hb_Events events) {
  outputs.sequence_number = packet->notification_sequence_no;
  outputs.events = events;
  outputs.group.Hb_events = events;
}

}  // namespace

void wait_for(int descriptor, Wait wait, int seconds) {
  if (wait == Wait::poll) {
    wait_with_poll(descriptor, seconds);
  } else {
    wait_with_select(descriptor, seconds);
  }
}

BareClient::BareClient(const std::string& socket_path) : socket_(socket(AF_UNIX, SOCK_STREAM, 0)) {
  set_buffers(socket_.get());
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::memcpy(address.sun_path, socket_path.c_str(), socket_path.size() + 1);
  const auto length = static_cast<socklen_t>(socket_path.size() + 2);
  if (connect(socket_.get(), reinterpret_cast<sockaddr*>(&address), length) != 0) throw_errno("connect");
}

client_packet* BareClient::receive() const {
  hb_frame_length length = 0;
  read_or_throw(socket_.get(), &length, sizeof length);
  char* bytes = new char[static_cast<size_t>(length)];
  read_or_throw(socket_.get(), bytes, static_cast<size_t>(length));
  return reinterpret_cast<client_packet*>(bytes);
}

void BareClient::send(Bytes& framed_request) const {
  iovec vectors[2] = {{framed_request.data(), HB_FRAME_PREFIX_SIZE},
                      {framed_request.data() + HB_FRAME_PREFIX_SIZE, framed_request.size() - HB_FRAME_PREFIX_SIZE}};
  if (writev(socket_.get(), vectors, 2) != static_cast<ssize_t>(framed_request.size())) throw_errno("writev");
}

void take_failure_data(client_packet* packet, Outputs& outputs) {
  copy_header(packet, outputs, HB_EVENT_FFDC_ID);
  std::memcpy(outputs.group.Hb_ffdc_id, packet->ffdc_id, sizeof packet->ffdc_id);
  std::memcpy(outputs.name, "Hb_FFDC_Group", sizeof "Hb_FFDC_Group");
  release(packet);
}

void take_node_event(client_packet* packet, Outputs& outputs, int nodes) {
  copy_header(packet, outputs, HB_EVENT_DEATH);
  auto& members = outputs.group.Hb_membership_grp_union.Hb_node_membership_grp;
  std::memcpy(members.Hb_node_list, packet->message, static_cast<size_t>(nodes) * sizeof(Hb_Boolean));
  std::memcpy(outputs.group.Hb_ffdc_id, packet->ffdc_id, sizeof packet->ffdc_id);
  std::memcpy(outputs.name, packet->subscription_name, sizeof outputs.name);
  outputs.group.Hb_group_type = Hb_Node_Group;
  outputs.group.Hb_group_status = Hb_Group_Unstable;
  release(packet);
}

void take_adapter_event(client_packet* packet, Outputs& outputs, BareConfiguration* tables) {
  copy_header(packet, outputs, HB_EVENT_DEATH);
  auto& members = outputs.group.Hb_membership_grp_union.Hb_adapter_membership_grp;
  std::memset(members.Hb_adapter_list, 0xFF, sizeof members.Hb_adapter_list);
  hb_adapter_event_header header;
  std::memcpy(&header, packet->message, sizeof header);
  const char* position = packet->message + sizeof header;
  for (int32_t index = 0; index <= header.last_index; ++index, position += sizeof(hb_adapter_event_entry)) {
    hb_adapter_event_entry entry;
    std::memcpy(&entry, position, sizeof entry);
    members.Hb_adapter_list[entry.adapter] = entry.incarnation;
    if (tables != nullptr) tables->find(entry.adapter)->Hb_state = Hb_Entity_Down;
  }
  members.Hb_num_adapters = header.last_index + 1;
  std::memcpy(outputs.name, packet->subscription_name, sizeof outputs.name);
  outputs.group.Hb_group_type = Hb_Adapter_Group;
  outputs.group.Hb_group_status = Hb_Group_Unstable;
  release(packet);
}

void release(client_packet* packet) { delete[] reinterpret_cast<char*>(packet); }

}  // namespace bench
