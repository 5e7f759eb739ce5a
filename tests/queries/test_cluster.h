// A cluster with gaps, and a client that has loaded a configuration without a daemon.
#pragma once

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "hb_client.h"
#include "hb_communication/packet.h"
#include "hb_global_data/state.h"
#include "support/bytes.h"

namespace hb_test {

// Nodes 0, 3 and 4 of 8 have adapters, four slots a node; networks 0, 1 and 3 of 4 are in use; this is node 3.
//   list position  0         1          2         3         4
//   adapter        13        0          12        17        2
//   node           3         0          3         4         0
//   network        1         0          0         1         3
//   address        10.0.1.3  10.0.0.10  10.0.0.3  10.0.1.4  10.0.3.10
//   type           en1       en0        en0       en1       disk2
//   state          1 up      1 up       2 down    0 undef   1 up
ConfigurationMessage sparse_cluster();

// An address as the queries take it.
Hb_IP_address6 address_of(const std::string& text);

// Writes a text with its terminator into the front of a field.
template <size_t N>
void set_text(char (&field)[N], const char* text) {
  std::memcpy(field, text, std::strlen(text) + 1);
}

// The bytes in a new array, as the library holds a packet.
Packet packet_of(const Bytes& bytes);

// Loads the configuration and the node table as a start does, and marks the client as started.
void load(const ConfigurationMessage& configuration);
void unload();

// What a stop leaves (limits, flags of nodes, network slots, sites) as in a fresh process.
void forget_leftovers();

// A client that has loaded a configuration, and has no connection.
class Loaded_Client : public testing::Test {
 protected:
  explicit Loaded_Client(const ConfigurationMessage& configuration = sparse_cluster()) {
    forget_leftovers();
    load(configuration);
  }
  ~Loaded_Client() override { unload(); }

  static void reload(const ConfigurationMessage& configuration);
};

// The trace categories.
inline constexpr size_t trace_errors = 0;
inline constexpr size_t trace_info = 1;
inline constexpr size_t trace_debug = 2;

// Registers the trace component, switches that one category on and forgets the records made so far.
void trace_only(size_t category);
void trace_all();
void trace_nothing();

// A number that no operation sets: whoever finds it knows that the error number was left alone.
inline constexpr int untouched_error = 12345;

template <typename Operation>
testing::AssertionResult fails_with(int error, Operation operation) {
  set_hb_errno(untouched_error);
  const Hb_Rc result = operation();
  if (result != Hb_Failure) return testing::AssertionFailure() << "the operation returned " << result;
  if (hb_get_errno() != error) return testing::AssertionFailure() << "the error number is " << hb_get_errno();
  return testing::AssertionSuccess();
}

template <typename Operation>
testing::AssertionResult fails_without_error_number(Operation operation) {
  return fails_with(untouched_error, operation);
}

// Success, which leaves the error number alone.
template <typename Operation>
testing::AssertionResult succeeds(Operation operation) {
  set_hb_errno(untouched_error);
  const Hb_Rc result = operation();
  if (result != Hb_Success) {
    return testing::AssertionFailure() << "the operation returned " << result << ", error " << hb_get_errno();
  }
  if (hb_get_errno() != untouched_error) return testing::AssertionFailure() << "it set error " << hb_get_errno();
  return testing::AssertionSuccess();
}

}  // namespace hb_test
