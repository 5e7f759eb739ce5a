// A program that follows a cluster in VEX mode: it polls, takes events, and keeps a picture of the cluster from nothing
// but what the public interface tells it.
#pragma once

#include <compare>
#include <map>
#include <ostream>
#include <set>
#include <string>
#include <vector>

#include "hb_client.h"

namespace hb_test {

// An adapter by what stays the same when numbers change.
struct Known_Adapter {
  int node;
  std::string type;
  std::string address;  // as hexadecimal digits

  auto operator<=>(const Known_Adapter&) const = default;
  friend std::ostream& operator<<(std::ostream& out, const Known_Adapter& adapter) {
    return out << adapter.node << '/' << adapter.type << '/' << adapter.address;
  }
};

std::string hexadecimal(const void* bytes, size_t size);

// What one call of hb_get_event_message() told. It tells something, too, when only waking the caller again failed.
struct Taken_Event {
  Hb_Rc result = Hb_Failure;
  int error = 0;  // the error number afterwards
  Hb_Events events = 0;
  std::string name;
  Hb_Seq_Num sequence = 0;
  std::set<int> nodes;               // of a node group
  std::set<Known_Adapter> adapters;  // of an adapter group
  std::set<uint32_t> local_part;     // of a split or a merge
  std::set<uint32_t> remote_part;
};

class Caller {
 public:
  Caller() = default;
  ~Caller();
  Caller(const Caller&) = delete;
  Caller& operator=(const Caller&) = delete;

  // Opens the monitors, subscribes to nodes, adapters and splits, and reads the configuration.
  Hb_Rc start();

  // The steps of a start behind the opening of the monitors, which a client of the daemon takes as well.
  Hb_Rc subscribe();
  Hb_Rc follow();  // asks for the descriptors

  // Waits until something is readable, and takes one event.
  void wait_and_take_one();

  // Polls without waiting. When something is readable it takes one event and returns true.
  bool take_one();

  // Takes events until nothing is readable, but no more than `limit`. Returns how many.
  size_t take_all(size_t limit = 64);

  // Follows the configuration in force.
  void read_configuration();

  // What the program thinks of the cluster.
  std::set<int> configured_nodes;
  std::set<int> nodes_up;
  std::set<Known_Adapter> configured_adapters;
  std::set<Known_Adapter> adapters_up;

  std::vector<Taken_Event> taken;
  int unknown_adapters = 0;  // adapters that an event named and no configuration had

  std::string node_subscription = "nodes";
  std::string adapter_subscription = "adapters";
  std::string split_subscription = "splits";

 private:
  std::vector<int> readable(int milliseconds) const;
  bool take_from(std::vector<int> ready);
  void apply(Taken_Event& event);
  void apply_nodes(Taken_Event& event);
  void apply_adapters(Taken_Event& event);
  static void read_parts(Taken_Event& event);

  int* descriptors_ = nullptr;
  int descriptor_count_ = 0;
  std::map<Hb_Adapter_Number, Known_Adapter> by_number_;
};

}  // namespace hb_test
