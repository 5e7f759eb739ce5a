// Lists of interfaces: finding in them, copying them, telling boot addresses from aliases, and the two global ones.
#include <functional>
#include <thread>

#include "VEX_EVMONAdapterEventHandler.h"
#include "support/system_calls.h"
#include "table_state.h"

namespace hb_test {
namespace {

// What happens inside the query, which is asked under the mutex.
std::function<void()> at_interface_query;

}  // namespace
}  // namespace hb_test

extern "C" {
// Of AddressSanitizer, where it is in. It does not see a thread's stack go by cancellation unless it is told.
[[gnu::weak]] void __asan_handle_no_return();

int __real_zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** list);
int __wrap_zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** list);
int __wrap_zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** list) {
  if (hb_test::at_interface_query) hb_test::at_interface_query();
  return __real_zu_vex_get_net_intf_info(list);
}
}

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

zu_vex_IP_address6_t address_of_words(uint32_t a, uint32_t b, uint32_t c, uint32_t d) {
  zu_vex_IP_address6_t address;
  address.zu_vex_v4_in_v6 = {{a, b, c}, d};
  return address;
}

// Comparing addresses.

struct Address_Pair {
  zu_vex_IP_address6_t first;
  zu_vex_IP_address6_t second;
  int same;
};

class SameIpAddress : public testing::TestWithParam<Address_Pair> {};

TEST_P(SameIpAddress, IsToldEitherWayRound) {
  EXPECT_EQ(same_ip_address(&GetParam().first, &GetParam().second), GetParam().same);
  EXPECT_EQ(same_ip_address(&GetParam().second, &GetParam().first), GetParam().same);
}

const uint32_t mapped = htonl(0xFFFF);

INSTANTIATE_TEST_SUITE_P(
    Pairs, SameIpAddress,
    testing::Values(Address_Pair{address_of_words(0, 0, mapped, 7), address_of_words(0, 0, mapped, 7), 1},
                    Address_Pair{address_of_words(0, 0, mapped, 7), address_of_words(0, 0, mapped, 8), 0},
                    Address_Pair{address_of_words(0, 0, mapped, 7), address_of_words(0, 0, 0, 7), 0},
                    Address_Pair{address_of_words(0, 0, mapped, 7), address_of_words(1, 0, mapped, 7), 0},
                    Address_Pair{address_of_words(0, 0, mapped, 7), address_of_words(0, 1, mapped, 7), 0},
                    Address_Pair{address_of_words(1, 2, 3, 4), address_of_words(1, 2, 3, 4), 1},
                    Address_Pair{address_of_words(1, 2, 3, 4), address_of_words(9, 2, 3, 4), 0},
                    Address_Pair{address_of_words(1, 2, 3, 4), address_of_words(1, 9, 3, 4), 0},
                    Address_Pair{address_of_words(1, 2, 3, 4), address_of_words(1, 2, 9, 4), 0},
                    Address_Pair{address_of_words(1, 2, 3, 4), address_of_words(1, 2, 3, 9), 0},
                    Address_Pair{address_of_words(0, 0, 0, 0), address_of_words(0, 0, 0, 0), 1}));

TEST(SameIpAddressOfNothing, IsNone) {
  const zu_vex_IP_address6_t address = {};
  EXPECT_EQ(same_ip_address(nullptr, &address), 0);
  EXPECT_EQ(same_ip_address(&address, nullptr), 0);
}

TEST(SameIpAddressOfAnIpv4Address, MayBeGivenAsIpv6) {
  const zu_vex_IP_address6_t ipv4 = scripted_address(1, 2, 3);
  zu_vex_IP_address6_t ipv6 = {};
  const uint8_t bytes[16] = {0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0xFF, 0xFF, 10, 1, 2, 3};
  std::memcpy(&ipv6.zu_vex_i6_ipv6, bytes, sizeof bytes);
  EXPECT_EQ(same_ip_address(&ipv4, &ipv6), 1);
}

class InterfaceLists : public TableState {
 protected:
  ~InterfaceLists() override {
    at_interface_query = nullptr;
    zu_vex_free_net_intf_info(global_boot_ip_list);
    global_boot_ip_list = nullptr;
    hb_free_net_intf_copies(global_vex_net_intf_tbl);
    global_vex_net_intf_tbl = nullptr;
  }

  static Hb_Boolean has(zu_vex_net_intf_info_t* list, int node, const char* name, const zu_vex_IP_address6_t* address) {
    zu_vex_IP_address6_t copy = address != nullptr ? *address : zu_vex_IP_address6_t();
    return hb_check_if_in_netf_list_by_ipaddr_or_intf(list, node, name, address != nullptr ? &copy : nullptr);
  }

  // The entries as "node name flags".
  static std::vector<std::string> lines_of(const zu_vex_net_intf_info_t* list) {
    std::vector<std::string> lines;
    for (; list != nullptr; list = list->p_next) {
      lines.push_back(std::to_string(list->node_number) + ' ' + (list->p_name != nullptr ? list->p_name : "(null)") +
                      ' ' + std::to_string(list->flags));
    }
    return lines;
  }

  // Boot addresses of node 1 on en0 and en1, and an alias on en0.
  static void alias_beside_boot_addresses() {
    scripted_cluster().boot_addresses = {interface_of(1, "en0", 0), interface_of(1, "en1", 1)};
    scripted_cluster().interfaces = {interface_of(1, "en0", 0), interface_of(1, "en0", 9), interface_of(1, "en1", 1)};
  }

  // As a start leaves it.
  static void read_boot_addresses() { zu_vex_get_boot_addrs(&global_boot_ip_list); }

  static bool is_mutex_free() {
    bool is_free = false;
    std::thread([&is_free] {
      is_free = pthread_mutex_trylock(&global_boot_ip_list_mutex) == 0;
      if (is_free) pthread_mutex_unlock(&global_boot_ip_list_mutex);
    }).join();
    return is_free;
  }

  // Tries whether a failed lock, and then a failed unlock, of the mutex is asserted.
  static void expect_asserted(const std::function<void()>& call) {
    {
      SystemCalls calls;
      calls.only("pthread_mutex_lock", 0, &global_boot_ip_list_mutex).script("pthread_mutex_lock", {result(35)});
      calls.only("pthread_mutex_unlock", 0, &global_boot_ip_list_mutex).script("pthread_mutex_unlock", {result(0)});
      call();
    }
    {
      SystemCalls calls;
      calls.only("pthread_mutex_unlock", 0, &global_boot_ip_list_mutex).script("pthread_mutex_unlock", {result(1)});
      call();
    }
    pthread_mutex_unlock(&global_boot_ip_list_mutex);
    std::vector<std::string> texts;
    for (const Recorded_Assertion& assertion : platform_double().assertions) {
      texts.push_back(assertion.text + " in " + assertion.file);
    }
    EXPECT_THAT(texts, ElementsAre("pthread_mutex_lock(&global_boot_ip_list_mutex) == 0 in lib/hb_global_data",
                                   "pthread_mutex_unlock(&global_boot_ip_list_mutex) == 0 in lib/hb_global_data"));
    EXPECT_TRUE(is_mutex_free());
  }

  zu_vex_net_intf_info_t* const not_written = reinterpret_cast<zu_vex_net_intf_info_t*>(this);
  zu_vex_net_intf_info_t* list = not_written;
};

// Finding.

TEST_F(InterfaceLists, AnEmptyListHasNothing) {
  const zu_vex_IP_address6_t address = {};
  EXPECT_EQ(has(nullptr, -1, "en0", &address), Hb_False);
  EXPECT_EQ(has(nullptr, -1, nullptr, nullptr), Hb_False);
}

TEST_F(InterfaceLists, ANameAloneIsEnough) {
  zu_vex_net_intf_info_t* given = callers_list({interface_of(1, "en0", 0), interface_of(2, "en1", 1)});
  EXPECT_EQ(has(given, 2, "en1", nullptr), Hb_True);
  EXPECT_EQ(has(given, 1, "en1", nullptr), Hb_False);
  EXPECT_EQ(has(given, -1, "en1", nullptr), Hb_True);
  EXPECT_EQ(has(given, -1, "en2", nullptr), Hb_False);
}

TEST_F(InterfaceLists, AnAddressAloneIsEnough) {
  zu_vex_net_intf_info_t* given = callers_list({interface_of(1, "en0", 0), interface_of(2, "en1", 1)});
  const zu_vex_IP_address6_t there = scripted_address(1, 2, 1);
  const zu_vex_IP_address6_t elsewhere = scripted_address(1, 2, 2);
  EXPECT_EQ(has(given, 2, nullptr, &there), Hb_True);
  EXPECT_EQ(has(given, 1, nullptr, &there), Hb_False);
  EXPECT_EQ(has(given, -1, nullptr, &there), Hb_True);
  EXPECT_EQ(has(given, -1, nullptr, &elsewhere), Hb_False);
  EXPECT_EQ(has(given, -1, nullptr, nullptr), Hb_False);
}

TEST_F(InterfaceLists, ANameAndAnAddressHaveToBeOfOneEntry) {
  zu_vex_net_intf_info_t* given =
      callers_list({interface_of(1, "en0", 0), interface_of(1, "en0", 5), interface_of(1, "en1", 1)});
  const zu_vex_IP_address6_t second = scripted_address(1, 1, 5);
  const zu_vex_IP_address6_t of_en1 = scripted_address(1, 1, 1);
  EXPECT_EQ(has(given, 1, "en0", &second), Hb_True);
  EXPECT_EQ(has(given, 1, "en0", &of_en1), Hb_False);
  EXPECT_EQ(has(given, 1, "en1", &of_en1), Hb_True);
}

TEST_F(InterfaceLists, Of32CharactersOfANameTheRestDoesNotCount) {
  const std::string name(31, 'n');
  zu_vex_net_intf_info_t* given = callers_list({interface_of(1, name + "ab", 0)});
  EXPECT_EQ(has(given, 1, (name + "az").c_str(), nullptr), Hb_True);
  EXPECT_EQ(has(given, 1, (name + "zb").c_str(), nullptr), Hb_False);
  EXPECT_EQ(has(given, 1, name.c_str(), nullptr), Hb_False);
}

TEST_F(InterfaceLists, AnEntryWithoutANameHasAnEmptyOne) {
  zu_vex_net_intf_info_t* given = callers_list({{.node = 1, .name = std::nullopt}});
  EXPECT_EQ(has(given, 1, "en0", nullptr), Hb_False);
  EXPECT_EQ(has(given, 1, "", nullptr), Hb_True);
}

TEST_F(InterfaceLists, TheBootListInForceIsSearchedTheSameWay) {
  alias_beside_boot_addresses();
  read_boot_addresses();
  zu_vex_IP_address6_t boot = scripted_address(1, 1, 1);
  zu_vex_IP_address6_t alias = scripted_address(1, 1, 9);
  EXPECT_EQ(hb_check_if_in_global_boot_ip_list(1, "en1", &boot), Hb_True);
  EXPECT_EQ(hb_check_if_in_global_boot_ip_list(2, "en1", &boot), Hb_False);
  EXPECT_EQ(hb_check_if_in_global_boot_ip_list(-1, nullptr, &boot), Hb_True);
  EXPECT_EQ(hb_check_if_in_global_boot_ip_list(1, "en0", &alias), Hb_False);
  EXPECT_TRUE(is_mutex_free());
}

TEST_F(InterfaceLists, TheBootListInForceIsSearchedUnderItsMutex) {
  expect_asserted([] { hb_check_if_in_global_boot_ip_list(-1, "en0", nullptr); });
}

// Copying.

TEST_F(InterfaceLists, ACopyOfNothingIsEmpty) {
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, nullptr, 2, Hb_True), Hb_Success);
  EXPECT_EQ(list, nullptr);
}

struct Filter {
  uint64_t flags;
  Hb_Boolean negate;
  std::vector<std::string> kept;
};

class InterfaceFilter : public InterfaceLists, public testing::WithParamInterface<Filter> {};

TEST_P(InterfaceFilter, KeepsWhatItSaysInReverseOrder) {
  std::vector<Scripted_Interface> interfaces(4);
  const uint64_t flags[] = {0, 2, 0x100000002, 8};
  for (uint32_t i = 0; i < 4; ++i) interfaces[i] = {.node = i, .name = "en", .flags = flags[i]};
  zu_vex_net_intf_info_t* given = callers_list(interfaces);
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, given, GetParam().flags, GetParam().negate), Hb_Success);
  EXPECT_EQ(lines_of(list), GetParam().kept);
  hb_free_net_intf_copies(list);
}

constexpr const char* none_set = "0 en 0";
constexpr const char* alias_set = "1 en 2";
constexpr const char* two_set = "2 en 4294967298";
constexpr const char* other_set = "3 en 8";

INSTANTIATE_TEST_SUITE_P(Flags, InterfaceFilter,
                         testing::Values(Filter{0, Hb_True, {other_set, two_set, alias_set, none_set}},
                                         Filter{0, Hb_False, {other_set, two_set, alias_set, none_set}},
                                         Filter{2, Hb_True, {other_set, none_set}},
                                         Filter{2, Hb_False, {two_set, alias_set}},
                                         Filter{0x100000000, Hb_False, {two_set}}, Filter{10, Hb_True, {none_set}},
                                         Filter{0x40, Hb_False, {}},
                                         Filter{0x40, Hb_True, {other_set, two_set, alias_set, none_set}}));

TEST_F(InterfaceLists, ACopyIsWholeAndHasANameOfItsOwn) {
  zu_vex_net_intf_info_t original = {};
  char name[] = "a name that is longer than what any table keeps of it";
  original.node_number = 7;
  original.p_name = name;
  original.ip_addr = scripted_address(1, 2, 3);
  original.netmask = scripted_address(255, 255, 0);
  original.flags = 0x8000000000000001;
  original.type = ZU_VEX_DEVTYPE_TOKENRING;
  original.hwaddr = {{1, 2, 3, 4, 5, 6}};
  original.status = ZU_VEX_INTF_STATUS_STALE;
  original.cfg_op = 9;
  original.caller_data = this;
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, &original, 0, Hb_False), Hb_Success);
  ASSERT_NE(list, nullptr);
  EXPECT_EQ(last_allocation(), sizeof name);
  EXPECT_NE(list->p_name, original.p_name);
  EXPECT_STREQ(list->p_name, name);
  EXPECT_EQ(list->node_number, 7U);
  EXPECT_EQ(std::memcmp(&list->ip_addr, &original.ip_addr, 16), 0);
  EXPECT_EQ(std::memcmp(&list->netmask, &original.netmask, 16), 0);
  EXPECT_EQ(list->flags, original.flags);
  EXPECT_EQ(list->type, ZU_VEX_DEVTYPE_TOKENRING);
  EXPECT_EQ(std::memcmp(&list->hwaddr, &original.hwaddr, 6), 0);
  EXPECT_EQ(list->status, ZU_VEX_INTF_STATUS_STALE);
  EXPECT_EQ(list->cfg_op, 9U);
  EXPECT_EQ(list->caller_data, this);
  EXPECT_EQ(list->p_next, nullptr);
  hb_free_net_intf_copies(list);
}

TEST_F(InterfaceLists, ACopyOfANameWithoutAnEndHas255Characters) {
  std::string name(300, 'x');
  name[255] = 'y';
  zu_vex_net_intf_info_t original = {};
  original.p_name = name.data();
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, &original, 0, Hb_False), Hb_Success);
  ASSERT_NE(list, nullptr);
  EXPECT_EQ(std::string(list->p_name), std::string(255, 'x'));
  hb_free_net_intf_copies(list);
}

TEST_F(InterfaceLists, BehindTheLongestNameNothingIsRead) {
  const std::unique_ptr<char[]> name(new char[255]);
  std::memset(name.get(), 'x', 255);
  zu_vex_net_intf_info_t original = {};
  original.p_name = name.get();
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, &original, 0, Hb_False), Hb_Success);
  ASSERT_NE(list, nullptr);
  EXPECT_EQ(last_allocation(), 256U);
  hb_free_net_intf_copies(list);
}

// A list whose last entry leads back to its second.
class EndlessList : public InterfaceLists {
 protected:
  EndlessList() {
    for (uint32_t i = 0; i < 3; ++i) {
      names[i] = "en" + std::to_string(i);
      records[i] = {};
      records[i].node_number = 1;
      records[i].p_name = names[i].data();
      records[i].ip_addr = scripted_address(1, 1, static_cast<uint8_t>(i));
    }
    records[0].p_next = &records[1];
    records[1].p_next = &records[2];
    records[2].p_next = &records[1];
  }

  static size_t length_of(const zu_vex_net_intf_info_t* list) {
    size_t length = 0;
    for (; list != nullptr; list = list->p_next) ++length;
    return length;
  }

  std::string names[3];
  zu_vex_net_intf_info_t records[3];
};

TEST_F(EndlessList, HasWhatIsInItAndNothingElse) {
  EXPECT_EQ(has(records, 1, "en2", nullptr), Hb_True);
  EXPECT_EQ(has(records, 1, "en3", nullptr), Hb_False);
}

TEST_F(EndlessList, IsCopiedUpToFourTimesWhatATableHolds) {
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, records, 0, Hb_False), Hb_Success);
  EXPECT_EQ(length_of(list), 4U * 98352);
  hb_free_net_intf_copies(list);
}

TEST_F(EndlessList, OfBootAddressesTellsAliasesAllTheSame) {
  trace_nothing();
  scripted_cluster().interfaces = {interface_of(1, "en2", 2), interface_of(1, "en2", 3)};
  for (const bool with_memory : {true, false}) {
    {
      const AllocationFailure failure(with_memory ? 1000 : 1);
      EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, records), Hb_Success);
      EXPECT_NE(failure.happened(), with_memory);
    }
    EXPECT_THAT(lines_of(list), ElementsAre("1 en2 0", "1 en2 2"));
    zu_vex_free_net_intf_info(list);
  }
}

TEST_F(EndlessList, OfInterfacesIsMarkedAndReturns) {
  trace_nothing();
  scripted_cluster().boot_addresses = {interface_of(1, "en0", 0), interface_of(1, "en2", 2)};
  read_boot_addresses();
  platform_double().net_intf_info.answers.push_back({0, records});
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, global_boot_ip_list), Hb_Success);
  ASSERT_EQ(list, records);
  EXPECT_EQ(records[0].flags, 0U);
  EXPECT_EQ(records[1].flags, 2U);
  EXPECT_EQ(records[2].flags, 0U);
}

TEST_F(InterfaceLists, ACopyOfAnEntryWithoutANameHasNone) {
  zu_vex_net_intf_info_t* given = callers_list({{.node = 3, .name = std::nullopt}});
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, given, 0, Hb_False), Hb_Success);
  EXPECT_THAT(lines_of(list), ElementsAre("3 (null) 0"));
  hb_free_net_intf_copies(list);
}

TEST_F(InterfaceLists, WithoutMemoryCopiesNothingAndLeavesTheCopiesBefore) {
  zu_vex_net_intf_info_t* given = callers_list({interface_of(1, "en0", 0), interface_of(1, "en1", 1)});
  // Records and names are allocated in turn: what stays is the pairs before the one that failed.
  const long stay[] = {0, 0, 2, 2};
  for (size_t nth = 1; nth <= 4; ++nth) {
    const LeakAllowed copies_stay;
    const long before = live_allocations();
    const AllocationFailure failure(nth);
    list = not_written;
    EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, given, 0, Hb_False), Hb_Failure) << nth;
    EXPECT_TRUE(failure.happened()) << nth;
    EXPECT_EQ(list, nullptr) << nth;
    EXPECT_EQ(live_allocations() - before, stay[nth - 1]) << nth;
  }
}

TEST_F(InterfaceLists, ReleasingCopiesReleasesRecordsAndNames) {
  zu_vex_net_intf_info_t* given = callers_list({interface_of(1, "en0", 0), interface_of(1, "en1", 1)});
  const long before = live_allocations();
  EXPECT_EQ(hb_copy_net_intf_filter_by_flag(&list, given, 0, Hb_False), Hb_Success);
  EXPECT_EQ(live_allocations() - before, 4);
  hb_free_net_intf_copies(list);
  EXPECT_EQ(live_allocations(), before);
  hb_free_net_intf_copies(nullptr);
}

// Aliases.

TEST_F(InterfaceLists, WithoutServicesNothingIsMarked) {
  scripted_cluster().has_services = false;
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, nullptr), Hb_Failure);
  EXPECT_EQ(list, not_written);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 277: -1"));
  EXPECT_EQ(hb_get_errno(), untouched_number);
}

TEST_F(InterfaceLists, WithoutServicesNothingIsMarkedWithoutTraceAsWell) {
  scripted_cluster().has_services = false;
  trace_nothing();
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, nullptr), Hb_Failure);
  EXPECT_EQ(list, not_written);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(InterfaceLists, WithoutAClusterNothingIsMarked) {
  alias_beside_boot_addresses();
  platform_double().cluster_info.answers.push_back({-4, nullptr});
  platform_double().errno_after_trace = 5;
  errno = 77;
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, nullptr), Hb_Failure);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(list, not_written);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 278: -4"));
}

TEST_F(InterfaceLists, WhatIsNotInTheBootListIsAnAlias) {
  alias_beside_boot_addresses();
  read_boot_addresses();
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, global_boot_ip_list), Hb_Success);
  EXPECT_THAT(lines_of(list), ElementsAre("1 en0 0", "1 en0 2", "1 en1 0"));
  EXPECT_THAT(data_lines(279, 1), ElementsAre("Info 279: [10.1.1.9]"));
  zu_vex_free_net_intf_info(list);
}

TEST_F(InterfaceLists, ABootAddressIsOneOfItsNodeAndItsInterface) {
  scripted_cluster().boot_addresses = {interface_of(1, "en0", 0)};
  scripted_cluster().interfaces = {interface_of(1, "en0", 0), interface_of(1, "en1", 0), interface_of(2, "en0", 0)};
  scripted_cluster().interfaces[2].address = scripted_address(1, 1, 0);
  read_boot_addresses();
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, global_boot_ip_list), Hb_Success);
  EXPECT_THAT(lines_of(list), ElementsAre("1 en0 0", "1 en1 2", "2 en0 2"));
  zu_vex_free_net_intf_info(list);
}

TEST_F(InterfaceLists, TheAliasFlagIsSetAnewAndTheOthersStay) {
  alias_beside_boot_addresses();
  scripted_cluster().interfaces[0].flags = 0x7;
  scripted_cluster().interfaces[1].flags = 0x8000000000000000;
  read_boot_addresses();
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, global_boot_ip_list), Hb_Success);
  EXPECT_THAT(lines_of(list), ElementsAre("1 en0 5", "1 en0 9223372036854775810", "1 en1 0"));
  zu_vex_free_net_intf_info(list);
}

TEST_F(InterfaceLists, WithoutBootAddressesEverythingIsAnAlias) {
  alias_beside_boot_addresses();
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, nullptr), Hb_Success);
  EXPECT_THAT(lines_of(list), ElementsAre("1 en0 2", "1 en0 2", "1 en1 2"));
  zu_vex_free_net_intf_info(list);
}

TEST_F(InterfaceLists, AnEmptyListOfInterfacesIsASuccess) {
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, nullptr), Hb_Success);
  EXPECT_EQ(list, nullptr);
}

TEST_F(InterfaceLists, AliasesAreToldWithLittleMemoryAsWell) {
  alias_beside_boot_addresses();
  scripted_cluster().boot_addresses.insert(scripted_cluster().boot_addresses.begin(), interface_of(1, "en0", 200));
  read_boot_addresses();
  trace_nothing();
  for (size_t nth = 1; nth <= 4; ++nth) {
    list = nullptr;
    bool happened = false;
    {
      const AllocationFailure failure(nth);
      EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, global_boot_ip_list), Hb_Success) << nth;
      happened = failure.happened();
    }
    EXPECT_EQ(happened, nth <= 3) << nth;  // the records, and the two arrays of the index
    EXPECT_THAT(lines_of(list), ElementsAre("1 en0 0", "1 en0 2", "1 en1 0")) << nth;
    zu_vex_free_net_intf_info(list);
  }
}

TEST_F(InterfaceLists, TheLargestNodeNumberIsNoNameForAnyNode) {
  constexpr uint32_t largest = 0xFFFFFFFF;
  trace_nothing();
  scripted_cluster().boot_addresses = {interface_of(1, "en0", 0)};
  scripted_cluster().interfaces = {interface_of(1, "en0", 0)};
  scripted_cluster().interfaces[0].node = largest;
  read_boot_addresses();
  for (size_t nth = 1; nth <= 4; ++nth) {
    {
      const AllocationFailure failure(nth);  // of the records, the two arrays of the index, and nothing
      EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&list, global_boot_ip_list), Hb_Success);
      EXPECT_EQ(failure.happened(), nth <= 3);
    }
    EXPECT_THAT(lines_of(list), ElementsAre("4294967295 en0 2")) << nth;
    zu_vex_free_net_intf_info(list);
  }
}

TEST_F(InterfaceLists, AStepThatFailsIsTracedWithTheErrnoItLeft) {
  platform_double().boot_addrs.answers.push_back({-1, nullptr, 14});
  platform_double().errno_after_trace = 5;
  hb_refresh_boot_ip_addrs(&list);
  EXPECT_EQ(errno, 14);
  EXPECT_THAT(data_lines(271, 2), ElementsAre("Errors 271: [hb_refresh_boot_ip_addrs] [zu_vex_get_boot_addrs] -1 14"));
}

// The interfaces by the boot list in force.

TEST_F(InterfaceLists, NewInterfacesAreMarkedAndThoseWithoutAliasesAreKept) {
  alias_beside_boot_addresses();
  read_boot_addresses();
  const zu_vex_net_intf_info_t* boot = global_boot_ip_list;
  EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Success);
  EXPECT_THAT(lines_of(list), ElementsAre("1 en0 0", "1 en0 2", "1 en1 0"));
  EXPECT_THAT(lines_of(global_vex_net_intf_tbl), ElementsAre("1 en1 0", "1 en0 0"));
  EXPECT_EQ(global_boot_ip_list, boot);
  EXPECT_TRUE(platform_double().traces_of(271).empty());
  zu_vex_free_net_intf_info(list);
}

TEST_F(InterfaceLists, NewInterfacesLeaveTheTableBeforeThemAllocated) {
  alias_beside_boot_addresses();
  read_boot_addresses();
  trace_nothing();
  const LeakAllowed tables_stay;
  const long before = live_allocations();
  for (long round = 1; round <= 3; ++round) {
    EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Success);
    zu_vex_free_net_intf_info(list);
    EXPECT_EQ(live_allocations() - before, round * 4);  // two records and their names each time
  }
}

TEST_F(InterfaceLists, NewInterfacesWithoutServicesFailAndChangeNothing) {
  scripted_cluster().has_services = false;
  platform_double().errno_after_trace = 5;
  errno = 77;
  EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Failure);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(list, not_written);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(277, 271));
  EXPECT_THAT(data_lines(271, 2),
              ElementsAre("Errors 271: [hb_get_new_net_intf_info] [hb_vex_get_net_intf_info_and_mark_alias] 3 77"));
}

TEST_F(InterfaceLists, NewInterfacesWithoutServicesFailWithoutTraceAsWell) {
  scripted_cluster().has_services = false;
  trace_nothing();
  EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Failure);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(InterfaceLists, NewInterfacesThatCannotBeCopiedFailAndChangeNothing) {
  scripted_cluster().interfaces = {interface_of(1, "en0", 0)};
  scripted_cluster().boot_addresses = scripted_cluster().interfaces;
  read_boot_addresses();
  errno = 77;
  {
    const AllocationFailure failure(4);  // behind the three of the marking
    EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Failure);
  }
  EXPECT_EQ(list, not_written);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_EQ(Scripted_Cluster::outstanding(), 1U);  // the boot list
  EXPECT_THAT(data_lines(271, 2),
              ElementsAre("Errors 271: [hb_get_new_net_intf_info] [hb_copy_net_intf_filter_by_flag] 3 77"));
}

TEST_F(InterfaceLists, NewInterfacesAreReadUnderTheMutex) {
  bool is_free = true;
  at_interface_query = [&is_free] { is_free = is_mutex_free(); };
  EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Success);
  EXPECT_FALSE(is_free);
  EXPECT_TRUE(is_mutex_free());
}

TEST_F(InterfaceLists, AFailedLockAroundNewInterfacesIsAsserted) {
  expect_asserted([this] { hb_get_new_net_intf_info(&list); });
}

TEST_F(InterfaceLists, TheMutexAroundNewInterfacesIsRecursive) {
  pthread_mutex_lock(&global_boot_ip_list_mutex);
  EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Success);
  EXPECT_FALSE(is_mutex_free());
  pthread_mutex_unlock(&global_boot_ip_list_mutex);
  EXPECT_TRUE(is_mutex_free());
}

void* read_new_interfaces(void* output) {
  hb_get_new_net_intf_info(static_cast<zu_vex_net_intf_info_t**>(output));
  return nullptr;
}

TEST_F(InterfaceLists, AThreadThatIsCancelledWhileItReadsNewInterfacesLetsTheMutexGo) {
  at_interface_query = [] {
    pthread_cancel(pthread_self());
    if (__asan_handle_no_return != nullptr) __asan_handle_no_return();
    pthread_testcancel();
  };
  pthread_t thread;
  ASSERT_EQ(pthread_create(&thread, nullptr, read_new_interfaces, &list), 0);
  void* how_it_ended = nullptr;
  ASSERT_EQ(pthread_join(thread, &how_it_ended), 0);
  EXPECT_EQ(how_it_ended, PTHREAD_CANCELED);
  EXPECT_TRUE(is_mutex_free());
  EXPECT_EQ(list, not_written);
}

// Boot addresses anew.

TEST_F(InterfaceLists, ARefreshWithoutServicesChangesNothing) {
  scripted_cluster().has_services = false;
  platform_double().errno_after_trace = 5;
  errno = 77;
  hb_refresh_boot_ip_addrs(&list);
  EXPECT_EQ(errno, 77);
  EXPECT_EQ(list, not_written);
  EXPECT_EQ(global_boot_ip_list, nullptr);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(282, 271, 283));
  EXPECT_THAT(value_lines(282), ElementsAre("Info 282"));
  EXPECT_THAT(value_lines(283), ElementsAre("Info 283"));
  EXPECT_THAT(data_lines(271, 2), ElementsAre("Errors 271: [hb_refresh_boot_ip_addrs] [zu_vex_get_boot_addrs] -1 77"));
}

TEST_F(InterfaceLists, ARefreshWithoutServicesChangesNothingWithoutTraceAsWell) {
  scripted_cluster().has_services = false;
  trace_nothing();
  hb_refresh_boot_ip_addrs(&list);
  EXPECT_EQ(list, not_written);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(InterfaceLists, ARefreshReplacesBothListsAndHandsOutAllInterfaces) {
  alias_beside_boot_addresses();
  hb_refresh_boot_ip_addrs(&list);
  EXPECT_THAT(lines_of(list), ElementsAre("1 en0 0", "1 en0 2", "1 en1 0"));
  EXPECT_THAT(lines_of(global_boot_ip_list), ElementsAre("1 en0 0", "1 en1 0"));
  EXPECT_THAT(lines_of(global_vex_net_intf_tbl), ElementsAre("1 en1 0", "1 en0 0"));
  zu_vex_free_net_intf_info(list);
  scripted_cluster().boot_addresses.push_back(interface_of(1, "en0", 9));
  hb_refresh_boot_ip_addrs(&list);
  EXPECT_THAT(lines_of(list), ElementsAre("1 en0 0", "1 en0 0", "1 en1 0"));
  EXPECT_THAT(lines_of(global_vex_net_intf_tbl), ElementsAre("1 en1 0", "1 en0 0", "1 en0 0"));
  zu_vex_free_net_intf_info(list);
}

TEST_F(InterfaceLists, ARefreshReleasesTheListsBefore) {
  alias_beside_boot_addresses();
  trace_nothing();
  hb_refresh_boot_ip_addrs(&list);
  zu_vex_free_net_intf_info(list);
  const long with_lists = live_allocations();
  for (int round = 0; round < 3; ++round) {
    hb_refresh_boot_ip_addrs(&list);
    zu_vex_free_net_intf_info(list);
    EXPECT_EQ(live_allocations(), with_lists);
    EXPECT_EQ(Scripted_Cluster::outstanding(), 2U);  // the boot list
  }
}

TEST_F(InterfaceLists, ARefreshReleasesWhatAStartLeft) {
  alias_beside_boot_addresses();
  read_boot_addresses();
  EXPECT_EQ(hb_vex_get_net_intf_info_and_mark_alias(&global_vex_net_intf_tbl, global_boot_ip_list), Hb_Success);
  hb_refresh_boot_ip_addrs(&list);
  zu_vex_free_net_intf_info(list);
  EXPECT_EQ(Scripted_Cluster::outstanding(), 2U);  // the boot list
}

TEST_F(InterfaceLists, ARefreshAfterNewInterfacesReleasesTheirCopies) {
  alias_beside_boot_addresses();
  read_boot_addresses();
  trace_nothing();
  const long before = live_allocations();
  EXPECT_EQ(hb_get_new_net_intf_info(&list), Hb_Success);
  zu_vex_free_net_intf_info(list);
  hb_refresh_boot_ip_addrs(&list);
  zu_vex_free_net_intf_info(list);
  EXPECT_EQ(live_allocations() - before, 4);  // one copy of two interfaces
}

TEST_F(InterfaceLists, ARefreshWithoutInterfacesDropsTheNewBootList) {
  alias_beside_boot_addresses();
  read_boot_addresses();
  const zu_vex_net_intf_info_t* boot = global_boot_ip_list;
  platform_double().net_intf_info.answers.push_back({-9, nullptr, 14});
  hb_refresh_boot_ip_addrs(&list);
  EXPECT_EQ(list, not_written);
  EXPECT_EQ(global_boot_ip_list, boot);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_EQ(Scripted_Cluster::outstanding(), 2U);  // the boot list in force
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(282, 277, 271, 283));
  EXPECT_THAT(data_lines(271, 2),
              ElementsAre("Errors 271: [hb_refresh_boot_ip_addrs] [hb_vex_get_net_intf_info_and_mark_alias] 3 14"));
}

TEST_F(InterfaceLists, ARefreshThatCannotCopyDropsTheNewLists) {
  scripted_cluster().interfaces = {interface_of(1, "en0", 0)};
  scripted_cluster().boot_addresses = scripted_cluster().interfaces;
  platform_double().set_levels({1, 0, 0});
  errno = 77;
  {
    const AllocationFailure failure(4);  // behind the three of the marking
    hb_refresh_boot_ip_addrs(&list);
  }
  EXPECT_EQ(list, not_written);
  EXPECT_EQ(global_boot_ip_list, nullptr);
  EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
  EXPECT_THAT(data_lines(271, 2),
              ElementsAre("Errors 271: [hb_refresh_boot_ip_addrs] [hb_copy_net_intf_filter_by_flag] 3 77"));
}

TEST_F(InterfaceLists, AFailedLockAroundARefreshIsAsserted) {
  expect_asserted([this] { hb_refresh_boot_ip_addrs(&list); });
}

// The refresh and what it changes.

class RefreshAndUpdate : public InterfaceLists {
 protected:
  void make_handler() {
    handler = std::make_unique<EVMONAdapterEventHandler>(path);
    adapter_event_handler_p = handler.get();
    start_tracing();
  }
  ~RefreshAndUpdate() override { adapter_event_handler_p = nullptr; }

  char path[8] = "adapter";
  std::unique_ptr<EVMONAdapterEventHandler> handler;
};

TEST_F(RefreshAndUpdate, WithoutServicesChangesNothing) {
  scripted_cluster().has_services = false;
  make_handler();
  hb_refresh_boot_ip_addrs_and_update_events();
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(280, 282, 271, 283, 233, 121, 134, 36, 285, 281));
  EXPECT_THAT(value_lines(280), ElementsAre("Info 280"));
  EXPECT_THAT(value_lines(281), ElementsAre("Info 281"));
  EXPECT_TRUE(VEX_event_queue_is_empty());
  EXPECT_EQ(hb_get_errno(), 63);
}

TEST_F(RefreshAndUpdate, BuildsTheTableFromTheRefreshedInterfacesAndGivesThemBack) {
  scripted_cluster().nodes = {{.number = 1}};
  alias_beside_boot_addresses();
  make_handler();
  hb_refresh_boot_ip_addrs_and_update_events();
  EXPECT_EQ(scripted_cluster().times_asked("zu_vex_get_net_intf_info"), 1U);
  EXPECT_EQ(Scripted_Cluster::outstanding(), 2U);  // the boot list
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 3);
  std::vector<std::pair<int, int>> queued;
  while (const std::unique_ptr<Hb_VEX_Event> event = take()) {
    queued.emplace_back(event->group.Hb_group_type, event->group.Hb_events);
  }
  EXPECT_THAT(queued, ElementsAre(std::pair(0, 2), std::pair(1, 2)));  // the node, then its adapters
}

TEST_F(RefreshAndUpdate, WithoutTheAdapterMonitorRefreshesTheListsAlone) {
  alias_beside_boot_addresses();
  hb_refresh_boot_ip_addrs_and_update_events();
  EXPECT_THAT(lines_of(global_boot_ip_list), ElementsAre("1 en0 0", "1 en1 0"));
  EXPECT_EQ(Scripted_Cluster::outstanding(), 2U);  // the boot list
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 0);
}

}  // namespace
}  // namespace hb_test
