#include "scripted_cluster.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <stdexcept>
#include <unordered_map>
#include <utility>

namespace {

constexpr uint32_t mapped_prefix = 0xFFFF;

void* new_block(size_t size) {
  void* block = std::calloc(1, std::max<size_t>(size, 1));
  if (block == nullptr) std::abort();
  return block;
}

// An address that a leak checker does not follow, so that what is known here and nowhere else is a leak.
class Hidden_Address {
 public:
  Hidden_Address() = default;
  explicit Hidden_Address(void* address) : bits_(~std::bit_cast<uintptr_t>(address)) {}
  void* address() const { return std::bit_cast<void*>(~bits_); }

 private:
  uintptr_t bits_ = ~uintptr_t{0};
};

constexpr size_t most_parts = 3;

// A record that this platform made, with the texts and lists that belong to it.
struct Made {
  Platform_Handout kind;
  bool is_out;
  std::array<Hidden_Address, most_parts> parts;
};

using Entry = std::pair<const uintptr_t, Made>;
using Made_Records =
    std::unordered_map<uintptr_t, Made, std::hash<uintptr_t>, std::equal_to<>, Unfailing_Allocator<Entry>>;

// They outlive the cluster: what is out may come back when a test is over.
Made_Records& made_records() {
  static auto* records = new (new_block(sizeof(Made_Records))) Made_Records;
  return *records;
}

size_t handed_out_count = 0;
size_t wrong_release_count = 0;

uintptr_t key_of(const void* record) { return ~std::bit_cast<uintptr_t>(record); }

Made* made(const void* record) {
  const auto found = made_records().find(key_of(record));
  return found == made_records().end() ? nullptr : &found->second;
}

// A record and what belongs to it, while it is put together.
class Making {
 public:
  Making(Platform_Handout kind, const void* pattern, size_t size) : record_(new_block(size)), made_{kind, false, {}} {
    if (pattern != nullptr) std::memcpy(record_, pattern, size);
  }

  char* text(const char* text) { return text == nullptr ? nullptr : copy(text, std::strlen(text) + 1); }
  char* text(const std::optional<std::string>& text) { return text ? this->text(text->c_str()) : nullptr; }

  template <typename Value>
  Value* copy(const Value* values, size_t count) {
    if (values == nullptr) return nullptr;
    auto* block = static_cast<Value*>(new_block(count * sizeof(Value)));
    std::memcpy(block, values, count * sizeof(Value));
    made_.parts.at(count_++) = Hidden_Address(block);
    return block;
  }

  template <typename Record>
  Record* done() {
    made_records().emplace(key_of(record_), made_);
    return static_cast<Record*>(record_);
  }
  template <typename Record>
  Record& record() {
    return *static_cast<Record*>(record_);
  }

 private:
  void* record_;
  Made made_;
  size_t count_ = 0;
};

void* next_of(void* record, Platform_Handout kind) {
  switch (kind) {
    case Platform_Handout::node_info:
      return static_cast<zu_vex_node_info_t*>(record)->p_next;
    case Platform_Handout::net_intf_info:
      return static_cast<zu_vex_net_intf_info_t*>(record)->p_next;
    case Platform_Handout::node_list:
      return static_cast<zu_evm_event_node_list_t*>(record)->next;
    case Platform_Handout::site_cfg:
      return static_cast<zu_evm_event_site_cfg_t*>(record)->next;
    default:
      return nullptr;
  }
}

void forget(void* record, const Made& known) {
  for (const Hidden_Address& part : known.parts) std::free(part.address());
  made_records().erase(key_of(record));
  std::free(record);
}

// A whole list that was never handed out.
void discard(void* record) {
  while (record != nullptr) {
    const Made* known = made(record);
    if (known == nullptr) return;
    void* next = next_of(record, known->kind);
    forget(record, Made(*known));
    record = next;
  }
}

zu_evm_event_node_list_t* copy_of(const zu_evm_event_node_list_t* list) {
  if (list == nullptr) return nullptr;
  Making making(Platform_Handout::node_list, list, sizeof *list);
  auto& record = making.record<zu_evm_event_node_list_t>();
  record.node_name = making.text(list->node_name);
  record.next = copy_of(list->next);
  return making.done<zu_evm_event_node_list_t>();
}

zu_evm_event_site_cfg_t* copy_of(const zu_evm_event_site_cfg_t* list) {
  if (list == nullptr) return nullptr;
  Making making(Platform_Handout::site_cfg, list, sizeof *list);
  auto& record = making.record<zu_evm_event_site_cfg_t>();
  record.node_name = making.text(list->node_name);
  record.site_name = making.text(list->site_name);
  record.next = copy_of(list->next);
  return making.done<zu_evm_event_site_cfg_t>();
}

// The system itself: a test may record and script the library's own calls.
int made_pair(int (&ends)[2]) {
  return static_cast<int>(syscall(SYS_socketpair, AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0, ends));
}

std::optional<uint64_t> file_of(int descriptor) {
  struct stat status {};
  if (fstat(descriptor, &status) != 0 || !S_ISSOCK(status.st_mode)) return std::nullopt;
  return status.st_ino;
}

constexpr char wake_byte = 'n';

void drop_a_byte(int descriptor) {
  char byte = 0;
  syscall(SYS_recvfrom, descriptor, &byte, 1, MSG_DONTWAIT, nullptr, nullptr);
}

class Kept_Errno {
 public:
  Kept_Errno() = default;
  ~Kept_Errno() { errno = saved_; }
  Kept_Errno(const Kept_Errno&) = delete;
  Kept_Errno& operator=(const Kept_Errno&) = delete;

 private:
  const int saved_ = errno;
};

int answer(const Platform_Result& result) {
  if (result.error != 0) errno = result.error;
  return result.result;
}

}  // namespace

zu_vex_IP_address6_t scripted_address(uint8_t a, uint8_t b, uint8_t c) {
  zu_vex_IP_address6_t address = {};
  address.zu_vex_v4_in_v6.filler[2] = htonl(mapped_prefix);
  address.zu_vex_v4_in_v6.v4_in_v6_ipv4 = htonl(0x0A000000U | uint32_t{a} << 16 | uint32_t{b} << 8 | uint32_t{c});
  return address;
}

Scripted_Cluster& scripted_cluster() {
  static Scripted_Cluster instance;
  static const struct At_End {
    ~At_End() { instance.reset(); }
  } at_end;
  return instance;
}

size_t Scripted_Cluster::times_asked(const std::string& call) const {
  return static_cast<size_t>(std::count_if(asked.begin(), asked.end(),
                                           [&](const Platform_Question& question) { return call == question.call; }));
}

zu_vex_cluster_info_t* Scripted_Cluster::new_cluster_info() {
  zu_vex_cluster_info_t pattern = {};
  pattern.local_node_number = local_node;
  Making making(Platform_Handout::cluster_info, &pattern, sizeof pattern);
  making.record<zu_vex_cluster_info_t>().p_cluster_name = making.text(cluster_name);
  return making.done<zu_vex_cluster_info_t>();
}

zu_vex_node_info_t* Scripted_Cluster::new_nodes(const std::vector<Scripted_Node>& list) {
  zu_vex_node_info_t* head = nullptr;
  for (auto node = list.rbegin(); node != list.rend(); ++node) {
    zu_vex_node_info_t pattern = {};
    pattern.number = node->number;
    pattern.status = node->status;
    pattern.node_down_reason = node->reason;
    pattern.p_next = head;
    Making making(Platform_Handout::node_info, &pattern, sizeof pattern);
    making.record<zu_vex_node_info_t>().p_name = making.text(node->name);
    head = making.done<zu_vex_node_info_t>();
  }
  return head;
}

zu_vex_net_intf_info_t* Scripted_Cluster::new_interfaces(const std::vector<Scripted_Interface>& list) {
  zu_vex_net_intf_info_t* head = nullptr;
  for (auto interface = list.rbegin(); interface != list.rend(); ++interface) {
    zu_vex_net_intf_info_t pattern = {};
    pattern.node_number = interface->node;
    pattern.ip_addr = interface->address;
    pattern.flags = interface->flags;
    pattern.type = ZU_VEX_DEVTYPE_ETHER;
    pattern.status = interface->status;
    pattern.p_next = head;
    Making making(Platform_Handout::net_intf_info, &pattern, sizeof pattern);
    making.record<zu_vex_net_intf_info_t>().p_name = making.text(interface->name);
    head = making.done<zu_vex_net_intf_info_t>();
  }
  return head;
}

size_t Scripted_Cluster::handed_out() { return handed_out_count; }

size_t Scripted_Cluster::outstanding() {
  return static_cast<size_t>(std::count_if(made_records().begin(), made_records().end(),
                                           [](const Entry& entry) { return entry.second.is_out; }));
}

size_t Scripted_Cluster::outstanding(Platform_Handout kind) {
  return static_cast<size_t>(std::count_if(made_records().begin(), made_records().end(), [&](const Entry& entry) {
    return entry.second.is_out && entry.second.kind == kind;
  }));
}

size_t Scripted_Cluster::wrong_releases() { return wrong_release_count; }

void Scripted_Cluster::deliver(void* record) {
  while (record != nullptr) {
    Made* known = made(record);
    if (known == nullptr || known->is_out) return;
    known->is_out = true;
    ++handed_out_count;
    record = next_of(record, known->kind);
  }
}

void Scripted_Cluster::release(void* record, std::initializer_list<Platform_Handout> kinds) {
  const Kept_Errno kept;
  while (record != nullptr) {
    const Made* known = made(record);
    if (known == nullptr || !known->is_out || std::find(kinds.begin(), kinds.end(), known->kind) == kinds.end()) {
      ++wrong_release_count;
      return;
    }
    void* next = next_of(record, known->kind);
    forget(record, Made(*known));
    record = next;
  }
}

const Scripted_Cluster::Monitor* Scripted_Cluster::find(int descriptor) const {
  const Kept_Errno kept;
  const auto found = std::find_if(monitors_.begin(), monitors_.end(), [&](const Monitor& monitor) {
    return monitor.descriptor == descriptor && file_of(descriptor) == monitor.identity;
  });
  return found == monitors_.end() ? nullptr : &*found;
}

Scripted_Cluster::Monitor* Scripted_Cluster::find(int descriptor) {
  return const_cast<Monitor*>(std::as_const(*this).find(descriptor));
}

Scripted_Cluster::Monitor& Scripted_Cluster::known(int descriptor) {
  Monitor* monitor = find(descriptor);
  if (monitor == nullptr) throw std::invalid_argument("the descriptor is no open monitor's");
  return *monitor;
}

bool Scripted_Cluster::is_open_monitor(int descriptor) const { return find(descriptor) != nullptr; }

std::vector<int> Scripted_Cluster::open_monitors() const {
  std::vector<int> descriptors;
  for (const Monitor& monitor : monitors_) {
    if (find(monitor.descriptor) == &monitor) descriptors.push_back(monitor.descriptor);
  }
  return descriptors;
}

std::string Scripted_Cluster::path_of(int descriptor) const {
  const Monitor* monitor = find(descriptor);
  return monitor == nullptr ? std::string() : std::string(monitor->path.c_str());
}

size_t Scripted_Cluster::waiting(int descriptor) const {
  const Monitor* monitor = find(descriptor);
  return monitor == nullptr ? 0 : monitor->queue.size();
}

void Scripted_Cluster::wake(int descriptor) {
  if (::send(known(descriptor).far_descriptor, &wake_byte, 1, MSG_NOSIGNAL | MSG_DONTWAIT) != 1) {
    throw std::runtime_error("the monitor takes no more notifications");
  }
}

void Scripted_Cluster::put(int descriptor, Waiting waiting) {
  Monitor* monitor = find(descriptor);
  if (monitor == nullptr) discard(waiting.record);
  known(descriptor).queue.push_back(waiting);
  wake(descriptor);
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_node_liveness_t& record) {
  Making making(Platform_Handout::node_liveness, &record, sizeof record);
  put(descriptor, {Platform_Handout::node_liveness, making.done<void>(), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_split_merge_cfg_t& record) {
  Making making(Platform_Handout::split_merge, &record, sizeof record);
  auto& made_record = making.record<zu_evm_event_split_merge_cfg_t>();
  made_record.local_node_numbers = making.copy(record.local_node_numbers, record.num_local_node_up);
  made_record.remote_node_numbers = making.copy(record.remote_node_numbers, record.num_remote_node_up);
  put(descriptor, {Platform_Handout::split_merge, making.done<void>(), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_adapter_liveness_t& record) {
  Making making(Platform_Handout::adapter_liveness, &record, sizeof record);
  making.record<zu_evm_event_adapter_liveness_t>().p_interface_name = making.text(record.p_interface_name);
  put(descriptor, {Platform_Handout::adapter_liveness, making.done<void>(), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_ip_change_t& record) {
  Making making(Platform_Handout::ip_change, &record, sizeof record);
  making.record<zu_evm_event_ip_change_t>().p_interface_name = making.text(record.p_interface_name);
  put(descriptor, {Platform_Handout::ip_change, making.done<void>(), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_node_list_t& list) {
  put(descriptor, {Platform_Handout::node_list, copy_of(&list), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_process_liveness_t& record) {
  Making making(Platform_Handout::process_liveness, &record, sizeof record);
  making.record<zu_evm_event_process_liveness_t>().process_name = making.text(record.process_name);
  put(descriptor, {Platform_Handout::process_liveness, making.done<void>(), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_cluster_reconfig_t& record) {
  Making making(Platform_Handout::cluster_reconfig, &record, sizeof record);
  put(descriptor, {Platform_Handout::cluster_reconfig, making.done<void>(), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_repository_disk_t& record) {
  Making making(Platform_Handout::repository_disk, &record, sizeof record);
  making.record<zu_evm_event_repository_disk_t>().disk_name = making.text(record.disk_name);
  put(descriptor, {Platform_Handout::repository_disk, making.done<void>(), {0}});
}

void Scripted_Cluster::notify(int descriptor, const zu_evm_event_site_cfg_t& list) {
  put(descriptor, {Platform_Handout::site_cfg, copy_of(&list), {0}});
}

void Scripted_Cluster::notify_result(int descriptor, int result, int error) {
  put(descriptor, {std::nullopt, nullptr, {result, error}});
}

void Scripted_Cluster::reset() {
  for (Monitor& monitor : monitors_) {
    for (const Waiting& waiting : monitor.queue) discard(waiting.record);
    syscall(SYS_close, monitor.far_descriptor);
  }
  handed_out_count = 0;
  wrong_release_count = 0;
  *this = Scripted_Cluster();
}

void Scripted_Cluster::ask(const char* call, const zu_evm_event_metadata_t* event) {
  const Kept_Errno kept;
  Platform_Question question{.call = call, .path = {}, .init_string = {}};
  if (event != nullptr) {
    question.has_metadata = true;
    question.category = event->category;
    question.event = event->event.p_node_liveness;
  }
  asked.push_back(question);
}

int Scripted_Cluster::open(const char* path, const char* init_string, int* descriptor) {
  asked.push_back({.call = "zu_evm_open",
                   .path = path == nullptr ? "" : path,
                   .init_string = init_string == nullptr ? "" : init_string});
  Platform_Result result = has_monitors ? platform_as_usual : Platform_Result{};
  if (!open_results.empty()) {
    result = open_results.front();
    open_results.pop_front();
  }
  if (!result.as_usual) return answer(result);
  int ends[2];
  if (!has_monitors || made_pair(ends) != 0) return -1;
  monitors_.push_back({ends[0], file_of(ends[0]).value_or(0), ends[1], path == nullptr ? "" : path, {}});
  *descriptor = ends[0];
  return 0;
}

int Scripted_Cluster::read(const char* call, int descriptor, std::initializer_list<Platform_Handout> kinds,
                           void** record, Platform_Handout* kind) {
  asked.push_back({.call = call, .descriptor = descriptor, .path = {}, .init_string = {}});
  Monitor* monitor = find(descriptor);
  if (monitor == nullptr) {
    if (stray_read_results.empty()) return -1;
    const Platform_Result result = stray_read_results.front();
    stray_read_results.pop_front();
    return answer(result);
  }
  {
    const Kept_Errno kept;
    drop_a_byte(descriptor);
  }
  if (monitor->queue.empty()) return ZU_EVM_NOTHING;
  const Waiting waiting = monitor->queue.front();
  monitor->queue.pop_front();
  if (!waiting.kind) {
    if (waiting.result.result >= 0) *record = nullptr;
    *kind = *kinds.begin();
    return answer(waiting.result);
  }
  if (std::find(kinds.begin(), kinds.end(), *waiting.kind) == kinds.end()) {
    discard(waiting.record);
    return answer({-1, EINVAL});
  }
  deliver(waiting.record);
  *record = waiting.record;
  *kind = *waiting.kind;
  return 0;
}
