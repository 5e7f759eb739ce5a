// Accessors that start the client, and accessors that work without it.
#include <gmock/gmock.h>

#include <functional>
#include <ostream>

#include "membership.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

struct Accessor {
  const char* name;
  std::function<Hb_Rc(Hb_Group*, void* output)> call;
};

void PrintTo(const Accessor& accessor, std::ostream* stream) { *stream << accessor.name; }

const Accessor starting_accessors[] = {
    {"hb_get_group_id",
     [](Hb_Group* group, void* out) { return hb_get_group_id(group, static_cast<Hb_Adapter_Identifier*>(out)); }},
    {"hb_get_group_leader_id",
     [](Hb_Group* group, void* out) {
       return hb_get_group_leader_id(group, static_cast<Hb_Adapter_Identifier*>(out));
     }},
    {"hb_get_group_status",
     [](Hb_Group* group, void* out) { return hb_get_group_status(group, static_cast<Hb_Group_Status*>(out)); }},
    {"hb_get_adapter_id",
     [](Hb_Group* group, void* out) { return hb_get_adapter_id(group, 0, static_cast<Hb_Adapter_Identifier*>(out)); }},
    {"hb_get_first_adapter",
     [](Hb_Group* group, void* out) { return hb_get_first_adapter(group, static_cast<Hb_Adapter_Identifier*>(out)); }},
    {"hb_get_next_adapter",
     [](Hb_Group* group, void* out) { return hb_get_next_adapter(group, static_cast<Hb_Adapter_Identifier*>(out)); }},
    {"hb_get_first_node",
     [](Hb_Group* group, void* out) { return hb_get_first_node(group, static_cast<Hb_Node_Number*>(out)); }},
    {"hb_get_next_node",
     [](Hb_Group* group, void* out) { return hb_get_next_node(group, static_cast<Hb_Node_Number*>(out)); }},
    {"hb_get_FFDC_id", [](Hb_Group* group, void* out) { return hb_get_FFDC_id(group, static_cast<Hb_FFDC_Id*>(out)); }},
    {"hb_get_different_instance_sender",
     [](Hb_Group* group, void* out) {
       return hb_get_different_instance_sender(group, static_cast<Hb_Diff_Instance_Info*>(out));
     }},
    {"hb_has_adapter_died_because_removed",
     [](Hb_Group*, void* out) {
       return static_cast<Hb_Rc>(hb_has_adapter_died_because_removed(static_cast<Hb_Adapter_Identifier*>(out)));
     }},
};

class StartingAccessors : public testing::TestWithParam<Accessor> {
 protected:
  StartingAccessors() {
    reset_platform();
    trace_all();
    std::memset(output, 'x', sizeof output);
  }
  ~StartingAccessors() override {
    trace_nothing();
    IsVEX = Hb_False;
  }

  bool output_untouched() const { return Bytes(output, sizeof output) == Bytes(sizeof output, 'x'); }

  FakeDaemon daemon;
  std::unique_ptr<Hb_Group> group = std::make_unique<Hb_Group>();
  alignas(8) char output[64];
};

TEST_P(StartingAccessors, FailAsTheStartDoesWhileNoDaemonIsThere) {
  daemon.stop_listening();
  EXPECT_TRUE(fails_with(15, [&] { return GetParam().call(group.get(), output); }));
  EXPECT_TRUE(output_untouched());
  EXPECT_THAT(platform_double().traces_of(310), IsEmpty());
}

TEST_P(StartingAccessors, FailAsTheStartDoesBeforeTheirPointersAreLookedAt) {
  daemon.stop_listening();
  EXPECT_TRUE(fails_with(15, [&] { return GetParam().call(nullptr, nullptr); }));
}

// The records are those of the start.
TEST_P(StartingAccessors, FailWithoutAnErrorNumberWhereTheClusterServicesAreAbsent) {
  IsVEX = Hb_True;
  EXPECT_TRUE(fails_without_error_number([&] { return GetParam().call(group.get(), output); }));
  EXPECT_TRUE(output_untouched());
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(272, 273, 276));
}

TEST_P(StartingAccessors, StartTheClientByThemselves) {
  daemon.serve_configuration(configuration_answer(sparse_cluster()));
  GetParam().call(group.get(), output);
  EXPECT_EQ(Hb_True, client_initialized);
  daemon.take_connection();
  hb_terminate();
}

INSTANTIATE_TEST_SUITE_P(Membership, StartingAccessors, testing::ValuesIn(starting_accessors),
                         [](const auto& test) { return std::string(test.param.name); });

TEST(UnstartedMembership, TheOtherAccessorsWorkWithoutTheClient) {
  reset_platform();
  const FakeDaemon daemon;
  const auto group = std::make_unique<Hb_Group>();
  group->Hb_group_type = Hb_Adapter_Group;
  Hb_Adapter_Identifier id = {1, 7, Hb_False};
  Hb_Site_Split_Info split;
  Hb_Site_Merge_Info merge;
  Hb_Split_Merge_Info info;
  EXPECT_EQ(7U, hb_adapter_incarnation(&id));
  EXPECT_EQ(Hb_Success, hb_get_site_split_info(group.get(), &split));
  EXPECT_EQ(Hb_Success, hb_get_site_merge_info(group.get(), &merge));
  EXPECT_EQ(Hb_Success, hb_get_split_info(group.get(), &info));
  EXPECT_EQ(Hb_Success, hb_get_merge_info(group.get(), &info));
  hb_free_split_info(&info);
  hb_free_merge_info(&info);
  EXPECT_EQ(Hb_Success, hb_site_down(group.get()));
  EXPECT_EQ(Hb_Success, hb_site_merge(group.get()));
  EXPECT_FALSE(daemon.has_client());
  EXPECT_EQ(Hb_False, client_initialized);
}

TEST(UnstartedMembership, WithoutAConfigurationNoNumberIsInRange) {
  reset_platform();
  forget_leftovers();
  const FakeDaemon daemon;
  const auto group = std::make_unique<Hb_Group>();
  group->Hb_group_type = Hb_Adapter_Group;
  EXPECT_EQ(Hb_False, adapter_in_group(group.get(), 0));
  EXPECT_EQ(4, hb_get_errno());
  EXPECT_EQ(0, node_in_group(group.get(), 0));
  EXPECT_EQ(4, hb_get_errno());
  EXPECT_FALSE(daemon.has_client());
}

}  // namespace
}  // namespace hb_test
