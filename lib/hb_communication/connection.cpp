#include "hb_communication/connection.h"

#include <unistd.h>

#include <array>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <new>

#include "VEX_EVMONHandler.h"
#include "VEX_HBC_trace.h"
#include "hb_client/events.h"
#include "hb_client/lifecycle.h"
#include "hb_communication/configuration_load.h"
#include "hb_communication/vex_table_build.h"

Hb_Csock* client_socket = nullptr;
Hb_Select* client_select = nullptr;
int client_pid = 0;
char HB_SERVER_SOCKET[HB_SOCKET_PATH_SIZE] = HB_DEFAULT_SERVER_SOCKET;
char SERVER_SOCK_FNAME[HB_SOCKET_PATH_SIZE] = {};
timeval reply_from_server_deftimeout = {55, 0};

void mowl_pin_new_data(void* /*ptr*/, size_t /*sz*/) {}

namespace {

struct Error_Mapping {
  int32_t socket_error;
  int library_error;
};

constexpr Error_Mapping open_errors[] = {
    {Hb_Csock_OPEN_FAILURE, HB_ESOCKET},
    {Hb_Csock_OPT_FAILURE, HB_ESOCKOPT},
    {Hb_Csock_CONNECT_FAILURE, HB_ECONNECT},
};

constexpr Error_Mapping send_errors[] = {
    {Hb_Csock_INVALID_BUF_POINTER, HB_ESENDFAULT},
    {Hb_Csock_SEND_WOULD_BLOCK, HB_ESENDWOULDBLOCK},
    {Hb_Csock_SEND_NOT_RESTARTED, HB_ESENDNOTRESTARTED},
    {Hb_Csock_SEND_IO_ERROR, HB_ESENDIO},
    {Hb_Csock_END_OF_FILE, HB_EDAEMONGONE},
};

constexpr Error_Mapping configuration_receive_errors[] = {
    {Hb_Csock_INVALID_BUF_POINTER, HB_ERECVFAULT},
    {Hb_Csock_RECV_WOULD_BLOCK, HB_ERECVWOULDBLOCK},
    {Hb_Csock_RECV_NOT_RESTARTED, HB_ERECVNOTRESTARTED},
    {Hb_Csock_RECV_IO_ERROR, HB_ERECVIO},
    {Hb_Csock_END_OF_FILE, HB_EDAEMONGONE},
};

template <size_t N>
int library_error(const Error_Mapping (&mapping)[N], int32_t socket_error, int otherwise) {
  for (const Error_Mapping& entry : mapping) {
    if (entry.socket_error == socket_error) {
      return entry.library_error;
    }
  }
  return otherwise;
}

const char* non_empty_variable(const char* name) {
  const char* value = std::getenv(name);
  return value != nullptr && *value != '\0' ? value : nullptr;
}

// False, with the path as it was, when no socket address holds the variable's value.
bool resolve_base_path() {
  const char* base = std::getenv(HB_SERVER_SOCKET_VARIABLE);
  if (base == nullptr) {
    return true;
  }
  const size_t size = std::strlen(base) + 1;
  if (size > sizeof HB_SERVER_SOCKET) {
    return false;
  }
  std::memcpy(HB_SERVER_SOCKET, base, size);
  return true;
}

// Sets SERVER_SOCK_FNAME from the environment; false, with that path as it was, when no socket address holds it.
bool resolve_socket_path() {
  if (!resolve_base_path()) {
    return false;
  }
  const char* suffix = non_empty_variable(HB_DOMAIN_VARIABLE);
  if (suffix == nullptr) {
    suffix = non_empty_variable(HB_PARTITION_VARIABLE);
  }
  char path[HB_SOCKET_PATH_SIZE];
  const int length = suffix != nullptr ? std::snprintf(path, sizeof path, "%s.%s", HB_SERVER_SOCKET, suffix)
                                       : std::snprintf(path, sizeof path, "%s", HB_SERVER_SOCKET);
  if (length < 0 || static_cast<size_t>(length) >= sizeof path) {
    return false;
  }
  std::memcpy(SERVER_SOCK_FNAME, path, sizeof path);
  return true;
}

Hb_Rc stop_connecting(int error) {
  hb_remove_client_select();
  hb_remove_socket();
  return fail(error);
}

// A request's header and its data lie in one buffer that is no larger than what is sent.
void fill_header(char* packet, Hb_Client_Request kind, int len) {
  const auto put = [packet](size_t offset, int32_t value) { std::memcpy(packet + offset, &value, sizeof value); };
  std::memset(packet, 0, HB_REQUEST_HEADER_SIZE);
  put(offsetof(packet_str, kind), kind);
  put(offsetof(packet_str, len), len);
  put(offsetof(packet_str, origin.client.pid), client_pid);
}

Hb_Rc send_packet(char* packet, int length) {
  if (client_socket->send(packet, length) == Hb_Success) {
    return Hb_Success;
  }
  return fail(library_error(send_errors, client_socket->Error(), HB_ESEND));
}

Hb_Rc send_number(Hb_Client_Request kind, int number) {
  const int length = HB_REQUEST_HEADER_SIZE + number;
  std::unique_ptr<char[]> packet(new (std::nothrow) char[static_cast<size_t>(length)]());
  if (packet == nullptr) {
    return fail(HB_ENOMEM);
  }
  fill_header(packet.get(), kind, number);
  return send_packet(packet.get(), length);
}

Hb_Rc send_data(Hb_Client_Request kind, const void* data, int data_length) {
  char packet[sizeof(packet_str)];
  fill_header(packet, kind, data_length);
  std::memcpy(packet + HB_REQUEST_HEADER_SIZE, data, static_cast<size_t>(data_length));
  return send_packet(packet, HB_REQUEST_HEADER_SIZE + data_length);
}

}  // namespace

Hb_Rc hb_init_communication() {
  client_pid = getpid();
  if (!resolve_socket_path()) {
    // What an earlier start that failed left open is forgotten here as it is by a connection.
    client_socket = nullptr;
    client_select = nullptr;
    return fail(HB_ECONNECT);
  }
  client_socket = new (std::nothrow) Hb_Csock;
  if (client_socket == nullptr) {
    return stop_connecting(HB_ENOMEM);
  }
  const int32_t socket_error = client_socket->Error();
  if (socket_error != Hb_Csock_NO_ERROR) {
    hb_remove_socket();
    return fail(library_error(open_errors, socket_error, HB_ECOMM));
  }
  client_select = new (std::nothrow) Hb_Select;
  if (client_select == nullptr) {
    return stop_connecting(HB_ENOMEM);
  }
  return Hb_Success;
}

Hb_Rc hb_remove_socket() {
  trace(Trace_Info, trace_socket_removed);
  delete client_socket;
  client_socket = nullptr;
  return Hb_Success;
}

Hb_Rc hb_remove_client_select() {
  trace(Trace_Info, trace_selector_removed);
  delete client_select;
  client_select = nullptr;
  return Hb_Success;
}

Hb_Rc hb_send(Hb_Client_Request msg_type, void* msg_data, int msg_len) {
  if (IsVEX != Hb_False) {
    return Hb_Success;
  }
  if (msg_len < 0 || msg_len > (msg_data != nullptr ? HB_REQUEST_MESSAGE_SIZE : HB_REQUEST_NUMBER_IN_LEN)) {
    return fail(HB_EINVAL);
  }
  if (client_socket == nullptr) {
    return fail(HB_ECOMM);
  }
  return msg_data != nullptr ? send_data(msg_type, msg_data, msg_len) : send_number(msg_type, msg_len);
}

Hb_Rc await_readable(const timeval& timeout) {
  if (client_socket == nullptr || client_select == nullptr) {
    return fail(HB_ECOMM);
  }
  client_select->rd_zero();
  client_select->wr_zero();
  client_select->ex_zero();
  client_select->rd_set(client_socket->socket());
  client_select->timeout(timeout);
  while (client_select->wait() != Hb_Success) {
    // After a signal the selector holds the time that remains.
    if (client_select->Error() != Hb_Select_CAUGHT_SIGNAL) {
      return fail(HB_ECOMM);
    }
  }
  return client_select->rd_isset(client_socket->socket()) != 0 ? Hb_Success : fail(HB_ENOTREADY);
}

Hb_Rc receive_packet(Packet& packet) {
  if (client_socket == nullptr) {
    return fail(HB_ECOMM);
  }
  char* bytes = nullptr;
  int length = 0;
  if (client_socket->receive(&bytes, length) != Hb_Success) {
    return fail(client_socket->eof() == Hb_True ? HB_EDAEMONGONE : HB_ECOMM);
  }
  packet = Packet(bytes, static_cast<size_t>(length));
  return packet ? Hb_Success : fail(HB_ENOMEM);
}

Hb_Rc await_reply(Hb_Client_Reply kind, Packet& packet, const timeval* timeout) {
  if (timeout != nullptr && await_readable(*timeout) != Hb_Success) {
    return Hb_Failure;
  }
  if (receive_packet(packet) != Hb_Success) {
    return Hb_Failure;
  }
  return packet->kind == kind ? Hb_Success : fail(HB_EBADREPLY);
}

Hb_Rc hb_get_reply_from_server(Hb_Client_Reply msg_type, client_packet_t*& return_packet, timeval* timeout) {
  Packet packet;
  if (await_reply(msg_type, packet, timeout) != Hb_Success) {
    return Hb_Failure;
  }
  return_packet = packet.release();
  return Hb_Success;
}

namespace {

// The configuration is read at once: the daemon answers before it does anything else for a new client.
Hb_Rc receive_configuration(Packet& packet) {
  char* bytes = nullptr;
  int length = 0;
  if (client_socket->receive(&bytes, length) != Hb_Success) {
    return fail(library_error(configuration_receive_errors, client_socket->Error(), HB_ERECV));
  }
  packet = Packet(bytes, static_cast<size_t>(length));
  if (!packet) {
    return fail(HB_ENOMEM);
  }
  return packet->kind == HB_CONFIGURATION_INFO ? Hb_Success : fail(HB_EBADREPLY);
}

}  // namespace

Hb_Rc hb_recv_config_info(zu_vex_net_intf_info_t* p_intf_tbl) {
  if (IsVEX != Hb_False) {
    return hb_vex_update_global_tbl(&global_config_tbl, nullptr, nullptr, p_intf_tbl);
  }
  if (hb_send(HB_GET_CONFIG_INFO, nullptr, 0) != Hb_Success) {
    return Hb_Failure;
  }
  Packet packet;
  if (receive_configuration(packet) != Hb_Success) {
    return Hb_Failure;
  }
  return load_first_configuration(packet);
}

Hb_Rc hb_get_file_descriptor_array(int** descriptor, int* numbers_of_fds) {
  if (hb_init() != Hb_Success || descriptor == nullptr || numbers_of_fds == nullptr) {
    return Hb_Failure;
  }
  if (IsVEX == Hb_False && client_socket == nullptr) {
    return fail(HB_ECOMM);
  }
  int* descriptors =
      IsVEX != Hb_False ? EVMONHandler::getFileDescriptors() : new (std::nothrow) int[2]{client_socket->socket(), -1};
  if (descriptors == nullptr) {
    return fail(HB_ENOMEM);
  }
  *descriptor = descriptors;
  *numbers_of_fds = IsVEX != Hb_False ? EVMONHandler::getNumbersOfFileDescriptors() : 1;
  return Hb_Success;
}

Hb_Rc hb_free_file_descriptor_array(int* descriptors) {
  if (descriptors == nullptr) {
    return Hb_Failure;
  }
  delete[] descriptors;
  return Hb_Success;
}
