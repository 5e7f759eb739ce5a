// Any bytes as the daemon's end of the connection, in pieces of any size, from connecting to disconnecting, while every
// system call may fail.
#include "hb_client.h"
#include "hb_communication/connection.h"
#include "hb_communication/shared_memory.h"
#include "support/conventions.h"
#include "support/packets.h"
#include "support/system.h"
#include "utils.h"

namespace {

using fuzz::the_system;

constexpr int most_packets = 32;
constexpr size_t little_memory = 1U << 16U;  // to be had quickly
constexpr size_t much_memory = 1U << 24U;
constexpr int every_fourth = 4;

struct Session {
  uint8_t flags;
  uint8_t faults_at_start;  // bytes of script that follow
  uint8_t faults_later;     // bytes of script behind those
};

enum Session_Flag : uint8_t { starts_well = 1, awaits_answers = 2, waits_without_limit = 4, has_much_memory = 0xB5 };

// Makes configurations in whole frames small, so that they are checked quickly. Where the frames end is not looked at
// any closer than that.
void shrink_configurations(std::span<uint8_t> stream) {
  while (stream.size() > 4) {
    const auto length = fuzz::field<int32_t>(stream, 0);
    if (length < 0 || static_cast<size_t>(length) > stream.size() - 4) {
      return;
    }
    if (length > HB_REPLY_HEADER_SIZE) {
      const auto message_length = static_cast<size_t>(length - HB_REPLY_HEADER_SIZE);
      fuzz::shrink_configuration(stream.subspan(4 + HB_REPLY_HEADER_SIZE, message_length));
    }
    stream = stream.subspan(4 + static_cast<size_t>(length));
  }
}

Hb_Rc start() {
  return fuzz::expect_one_of(
      {HB_ESOCKET,        HB_ESOCKOPT,       HB_ECONNECT,      HB_EKEY_CONFIG,   HB_EKEY_ROUTE,    HB_EKEY_SECURITY,
       HB_EKEY_SEM,       HB_ESHMGET_ACCESS, HB_ESHMGET_INVAL, HB_ESHMGET_NOENT, HB_ESHMGET_NOMEM, HB_ESHMGET_LIMIT,
       HB_ESHMGET,        HB_ESHMAT_ACCESS,  HB_ESHMAT_INVAL,  HB_ESHMAT_NOENT,  HB_ESHMAT_NOMEM,  HB_ESHMAT,
       HB_ESEMGET_ACCESS, HB_ESEMGET_INVAL,  HB_ESEMGET_NOENT, HB_ESEMGET_NOMEM, HB_ESEMGET_NOSPC, HB_ESEMGET,
       HB_ESENDFAULT,     HB_ESENDIO,        HB_ESEND,         HB_ERECVFAULT,    HB_ERECVIO,       HB_ERECV,
       HB_EDAEMONGONE,    HB_EBADREPLY},
      hb_init);
}

Hb_Rc take_event(bool wait_without_limit) {
  static Hb_Group group;
  int descriptors[] = {fuzz::descriptor, -1};
  timeval timeout = {0, 0};
  Hb_Events events = 0;
  char name[HB_NAME_LENGTH];
  Hb_Seq_Num sequence = 0;
  const Hb_Rc rc = fuzz::expect_one_of({HB_ENOTREADY, HB_ECOMM, HB_EDAEMONGONE, HB_EBADREPLY}, [&] {
    return hb_get_event_message(descriptors, wait_without_limit ? nullptr : &timeout, &events, name, &group, &sequence);
  });
  REQUIRE(rc == Hb_Failure || std::memchr(name, '\0', sizeof name) != nullptr);
  return rc;
}

Hb_Rc await_answer() {
  timeval timeout = {0, 0};
  Packet answer;
  return fuzz::expect_one_of({HB_ENOTREADY, HB_ECOMM, HB_EDAEMONGONE, HB_EBADREPLY},
                             [&] { return await_reply(HB_CONFIG_ADAPTER, answer, &timeout); });
}

// Until the daemon is gone, which is where the bytes end.
void receive(uint8_t flags) {
  for (int i = 1; i <= most_packets; ++i) {
    const bool answer = (flags & awaits_answers) != 0 && i % every_fourth == 0;
    const Hb_Rc rc = answer ? await_answer() : take_event((flags & waits_without_limit) != 0);
    if (rc == Hb_Failure && hb_get_errno() == HB_EDAEMONGONE) {
      REQUIRE(client_socket->eof() == Hb_True);
      return;
    }
  }
}

// A start that failed leaves its connection and what it attached; here they go before the next one.
void clean_up() {
  hb_remove_client_select();
  hb_remove_socket();
  hb_detach_shared_memory();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static const fuzz::Buffer configuration = fuzz::framed(0, fuzz::small_configuration());
  static fuzz::Buffer stream;
  fuzz::Input input(bytes, size);
  const auto session = input.take<Session>();
  the_system.script = input.take_bytes(session.faults_at_start % 64U);
  const fuzz::Bytes script = input.take_bytes(session.faults_later % 64U);
  stream.clear();
  if ((session.flags & starts_well) != 0) {
    stream = configuration;
    the_system.script = {};
  }
  stream.insert(stream.end(), input.rest().begin(), input.rest().end());
  shrink_configurations(stream);
  the_system.stream = stream;
  the_system.largest_array = session.flags == has_much_memory ? much_memory : little_memory;

  const int blocks = memchunks;
  if (start() == Hb_Success) {
    the_system.script = script;
    receive(session.flags);
    the_system.script = {};
    fuzz::expect(fuzz::no_error, hb_terminate);
  } else {
    the_system.script = {};
    clean_up();
  }
  REQUIRE(the_system.open_connections == 0 && the_system.attached_segments == 0 && memchunks == blocks);
  return 0;
}
