// Doubles of every platform function. Linked into a test executable they stand in front of the platform libraries:
// they record what was asked of the platform and answer as the test has scripted.
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>
#include <vector>

#include "scripted_cluster.h"
#include "zu_cu.h"
#include "zu_mss.h"
#include "zu_tr.h"
#include "zu_vex.h"

struct Recorded_Category {
  uint32_t id;
  std::string name;
  uint32_t default_level;
  uint32_t minimum_level;
};

// One call of tr_ms_register_component_1().
struct Recorded_Registration {
  std::string component;
  std::vector<Recorded_Category> categories;
  uint8_t* levels;        // what the component gave: write here to change a level afterwards
  tr_file_token* tokens;  // what the component gave
};

enum class Trace_Form { id, values, data, strings };

// One call of a tr_ms_record_*() function; only the list that belongs to its form is filled.
struct Recorded_Trace {
  Trace_Form form;
  std::string component;
  uint32_t id;
  tr_file_token token;
  int category;  // index of the category that the token was handed out for, -1 for any other token
  std::vector<uint32_t> values;
  std::vector<std::vector<uint8_t>> blocks;  // copies; a null block is empty
  std::vector<std::string> strings;          // a null text is empty

  // Data block `index` as text up to its first NUL or its end, and as a 32-bit value. Both fail loudly
  // (std::out_of_range, std::length_error) rather than make something up.
  std::string block_text(size_t index) const;
  uint32_t block_value(size_t index) const;
};

// One call of __zu_assert().
struct Recorded_Assertion {
  std::string text;
  std::string file;
  int line;
};

enum class Assertion_Action { record_and_return, abort_process };

// Answer to one query of the cluster services: the output is written only with result 0.
template <typename Output>
struct Vex_Answer {
  int result;
  Output* output;
  int error = 0;          // left in `errno` when not 0
  bool as_usual = false;  // what the query yields without a script
};

// A query of the cluster services: answers are used up in order; without one the scripted cluster answers, whose
// services are absent (-1) unless a test has them appear.
template <typename Output>
struct Vex_Query {
  std::deque<Vex_Answer<Output>> answers;
  int calls = 0;
};

// Answer to one sec_unmarshal_typed_key(): the key is filled only with result 0, otherwise it is zeroed.
struct Unmarshal_Answer {
  int result;
  uint32_t type;
  int32_t version;
  std::vector<uint8_t> value;
};

// One call of sec_unmarshal_typed_key().
struct Recorded_Unmarshal {
  int32_t length;
  std::vector<uint8_t> bytes;  // copy; empty when the length is not positive or the bytes are null
  sec_key_desc* key;
};

// One call of sec_release_typed_key().
struct Recorded_Release {
  sec_key_desc* key;
  sec_key_desc before;  // the record as it was given; its pointers are no longer valid
};

struct Platform_Double {
  // Trace. Categories beyond `levels` get level 0.
  std::vector<uint8_t> levels;
  int registration_result = 0;
  std::vector<Recorded_Registration> registrations;
  std::vector<Recorded_Trace> traces;
  int errno_after_trace = 0;  // what each record has in `errno`, first and last; 0 leaves it alone

  // Assertions.
  Assertion_Action assertion_action = Assertion_Action::record_and_return;
  std::vector<Recorded_Assertion> assertions;

  // Cluster services.
  Vex_Query<zu_vex_cluster_info_t> cluster_info;
  Vex_Query<zu_vex_node_info_t> node_info;
  Vex_Query<zu_vex_node_info_t> node_info_after_event;
  Vex_Query<zu_vex_net_intf_info_t> net_intf_info;
  Vex_Query<zu_vex_net_intf_info_t> net_intf_info_after_event;
  Vex_Query<zu_vex_net_intf_info_t> boot_addrs;

  // Keys. Without an answer left a key is refused (-1).
  std::deque<Unmarshal_Answer> unmarshal_answers;
  std::vector<Recorded_Unmarshal> unmarshals;
  std::vector<Recorded_Release> releases;

  // Back to the state of a fresh process, except that levels and tokens handed out stay with the component. The
  // scripted cluster is reset, too.
  void reset();

  // Changes the levels of later registrations and of every component that has registered.
  void set_levels(const std::vector<uint8_t>& new_levels);

  // The token that category `index` gets at registration.
  static tr_file_token token(size_t index);

  std::vector<uint32_t> trace_ids() const;
  std::vector<Recorded_Trace> traces_of(uint32_t id) const;

  // Links the records into a list, in their order, and returns its head. The records and their names are the double's
  // until reset(), so that a test can script an interface list in place.
  zu_vex_net_intf_info_t* interface_list(const std::vector<zu_vex_net_intf_info_t>& records);

 private:
  std::deque<zu_vex_net_intf_info_t> interfaces_;
  std::deque<std::string> interface_names_;
};

// The double of this process.
Platform_Double& platform_double();
