#include "bare_tables.h"

#include <cstring>
#include <utility>

#include "hash.h"
#include "hb_protocol/configuration_message.h"

namespace bench {
namespace {

constexpr uint32_t node_buckets = 4099;

hb_configuration_header header_of(const char* message) {
  hb_configuration_header header;
  std::memcpy(&header, message, sizeof header);
  return header;
}

uint32_t buckets_for(int32_t adapters) { return static_cast<uint32_t>(prime(2 * adapters)); }

// The link that leads to the entry, or to where it belongs at the end of the chain.
template <typename IsKey>
BareEntry** place(BareEntry** link, BareEntry** previous, IsKey is_key) {
  *previous = nullptr;
  while (*link != nullptr && !is_key(**link)) {
    *previous = *link;
    link = &(*link)->next;
  }
  return link;
}

}  // namespace

BareTable::~BareTable() {
  for (uint32_t bucket = 0; bucket < size_; ++bucket) {
    for (BareEntry* entry = buckets_[bucket]; entry != nullptr;) delete std::exchange(entry, entry->next);
  }
  delete[] buckets_;
}

void* BareTable::find(uint32_t number) const {
  for (const BareEntry* entry = buckets_[number % size_]; entry != nullptr; entry = entry->next) {
    if (entry->key.number == number) return entry->item;
  }
  return nullptr;
}

bool BareTable::insert(uint32_t number, void* item) {
  BareEntry* previous = nullptr;
  BareEntry** link = place(&buckets_[number % size_], &previous,
                           [number](const BareEntry& entry) { return entry.key.number == number; });
  if (*link != nullptr) return false;
  *link = new BareEntry{{.number = number}, item, nullptr, previous, 1};
  return true;
}

bool BareTable::insert(const Hb_IP_address6& address, void* item) {
  uint32_t words[4];
  std::memcpy(words, &address, sizeof words);
  BareEntry* previous = nullptr;
  BareEntry** link =
      place(&buckets_[(words[0] + words[1] + words[2] + words[3]) % size_], &previous,
            [&](const BareEntry& entry) { return std::memcmp(entry.key.address, words, sizeof words) == 0; });
  if (*link != nullptr) return false;
  *link = new BareEntry{{.address = {words[0], words[1], words[2], words[3]}}, item, nullptr, previous, 3};
  return true;
}

BareConfiguration::BareConfiguration(const char* message)
    : count_(static_cast<size_t>(header_of(message).num_adapters)),
      adapters_(new Hb_Adapter[count_]),
      by_number_(buckets_for(header_of(message).num_adapters)),
      by_node_(node_buckets),
      nodes_(new Hb_Node_config_state[HB_MAX_NODES]),
      by_address_(buckets_for(header_of(message).num_adapters)) {
  const hb_configuration_header header = header_of(message);
  const auto adapters_per_node = static_cast<uint32_t>(header.adapters_per_node);
  const char* record = message + sizeof header;
  for (size_t index = 0; index < count_; ++index, record += sizeof(Hb_Adapter)) {
    std::memcpy(&adapters_[index], record, sizeof(Hb_Adapter));
    add(adapters_[index], adapters_[index].Hb_adapter_num / adapters_per_node);
  }
  std::memcpy(networks_, record, static_cast<size_t>(header.num_networks) * sizeof(Hb_Network));
}

BareConfiguration::~BareConfiguration() {
  delete[] adapters_;
  delete[] nodes_;
}

void BareConfiguration::add(Hb_Adapter& adapter, uint32_t node) {
  by_number_.insert(adapter.Hb_adapter_num, &adapter);
  if (by_node_.insert(node, &nodes_[node_count_])) {
    nodes_[node_count_++].node_num = static_cast<Hb_Node_Number>(node);
  }
  by_address_.insert(adapter.Hb_ip_address, &adapter);
}

}  // namespace bench
