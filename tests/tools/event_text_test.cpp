#include "event_text.h"

#include <gmock/gmock.h>

#include "sample_cluster.h"

namespace hbctl {
namespace {

using testing::EndsWith;
using testing::HasSubstr;

const Style kPlain(false);

Event event_of(Hb_Events bits) {
  Event event;
  event.bits = bits;
  event.sequence = 12;
  return event;
}

TEST(HbctlEventText, is_coloured_by_what_happened_and_aligned_all_the_same) {
  const WatchState state(sample_cluster());
  const Style coloured(true);
  EXPECT_THAT(event_line(event_of(1), state, coloured), HasSubstr("\033[31mdeath             \033[0m  "));
  EXPECT_THAT(event_line(event_of(2), state, coloured), HasSubstr("\033[32mjoin              \033[0m  "));
  EXPECT_THAT(event_line(event_of(4), state, coloured), HasSubstr("  new-group           "));
  EXPECT_THAT(event_line(event_of(128), state, coloured), HasSubstr("\033[36mconfiguration     \033[0m  "));
}

TEST(HbctlEventText, shows_an_adapter_that_is_not_configured_by_its_number_alone) {
  Event event = event_of(1);
  event.subject = Subject::Adapters;
  event.adapters = {{99, 1, false}};
  EXPECT_THAT(event_line(event, WatchState(sample_cluster()), kPlain), EndsWith("death               99\n"));
}

TEST(HbctlEventText, shows_a_group_of_adapters_without_a_leader) {
  Event event = event_of(4);
  event.subject = Subject::Adapters;
  event.identity = {0xFFFFFFFF, 5};
  event.stable = true;
  EXPECT_THAT(event_line(event, WatchState(sample_cluster()), kPlain),
              HasSubstr("none; no leader, incarnation 5, stable"));
}

TEST(HbctlEventText, says_whose_address_a_configuration_changes) {
  WatchState state(sample_cluster());
  Cluster next = sample_cluster();
  next.adapters[1].address = "10.0.0.99";
  state.replace_cluster(next);
  EXPECT_THAT(event_line(event_of(128), state, kPlain),
              EndsWith("3 nodes, 6 adapters, 2 networks; addresses changed of adapters 1\n"));
}

TEST(HbctlEventText, shows_an_empty_group_as_none) {
  Event event = event_of(4);
  event.subject = Subject::Nodes;
  event.stable = false;
  EXPECT_THAT(event_line(event, WatchState(sample_cluster()), kPlain), EndsWith("none; unstable\n"));
}

TEST(HbctlEventText, does_not_count_who_is_up_before_all_are_known) {
  WatchState state(sample_cluster());
  state.liveness().follow(plan_subscriptions({}, 7, "p", state.cluster()).subscriptions);
  Event event = event_of(2);
  event.subject = Subject::Nodes;
  event.nodes = {1};
  state.liveness().apply(event);
  EXPECT_THAT(event_line(event, state, kPlain), EndsWith("join                1\n"));
}

}  // namespace
}  // namespace hbctl
