// A platform library exports its own functions; what it is built from stays inside.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <memory>
#include <set>
#include <sstream>
#include <string>

using testing::ElementsAre;

namespace {

std::string output_of(const std::string& command) {
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> pipe(popen(command.c_str(), "r"), pclose);
  std::string output;
  std::array<char, 4096> part;
  while (pipe && std::fgets(part.data(), part.size(), pipe.get()) != nullptr) output += part.data();
  return output;
}

// Address and type stand before each name; a version stands behind it.
std::set<std::string> exports_of(const char* library) {
  std::istringstream lines(output_of(std::string("nm --dynamic --defined-only '") + library + "'"));
  std::set<std::string> names;
  std::string address;
  std::string type;
  std::string name;
  while (lines >> address >> type >> name) names.insert(name.substr(0, name.find('@')));
  return names;
}

TEST(Exports, OfTheTraceLibrary) {
  EXPECT_THAT(exports_of(ZU_TR_LIBRARY),
              ElementsAre("tr_ms_record_data_1", "tr_ms_record_id_1", "tr_ms_record_strings_1",
                          "tr_ms_record_values_32_1", "tr_ms_register_component_1"));
}

TEST(Exports, OfTheCommonLibrary) { EXPECT_THAT(exports_of(ZU_CU_LIBRARY), ElementsAre("__zu_assert")); }

TEST(Exports, OfTheSecurityLibrary) {
  EXPECT_THAT(exports_of(ZU_MSS_LIBRARY), ElementsAre("sec_release_typed_key", "sec_unmarshal_typed_key"));
}

TEST(Exports, OfTheClusterServicesAndMonitors) {
  EXPECT_THAT(exports_of(ZU_VEX_LIBRARY),
              ElementsAre("zu_evm_free", "zu_evm_open", "zu_evm_read_adapter_liveness", "zu_evm_read_cluster_reconfig",
                          "zu_evm_read_ip_change", "zu_evm_read_node_list", "zu_evm_read_node_liveness",
                          "zu_evm_read_process_liveness", "zu_evm_read_repository_disk", "zu_evm_read_site_cfg",
                          "zu_evm_read_split_merge", "zu_vex_free_cluster_info", "zu_vex_free_net_intf_info",
                          "zu_vex_free_node_info", "zu_vex_get_boot_addrs", "zu_vex_get_cluster_info",
                          "zu_vex_get_net_intf_info", "zu_vex_get_net_intf_info_after_event", "zu_vex_get_node_info",
                          "zu_vex_get_node_info_after_event"));
}

}  // namespace
