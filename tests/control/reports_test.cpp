// Reports that an adapter or a node may be down or is down: the number travels in the length field.
#include <gtest/gtest.h>

#include <functional>
#include <ostream>

#include "hb_communication/control_requests.h"
#include "steering.h"
#include "support/allocation_faults.h"

namespace hb_test {
namespace {

template <typename Number>
struct Report {
  const char* name;
  std::function<Hb_Rc(Number)> call;
  int32_t code;
};

template <typename Number>
void PrintTo(const Report<Number>& report, std::ostream* stream) {
  *stream << report.name;
}

using Adapter_Report = Report<Hb_Adapter_Number>;
using Node_Report = Report<Hb_Node_Number>;

// The last one is how the others are made.
const Adapter_Report adapter_reports[] = {
    {"hb_adapter_may_be_down", hb_adapter_may_be_down, 205},
    {"hb_adapter_is_down", hb_adapter_is_down, 206},
    {"hb_notify_adapter_down",
     [](Hb_Adapter_Number adapter) { return hb_notify_adapter_down(adapter, HB_NODE_IS_DOWN); }, 204},
};

const Node_Report node_reports[] = {
    {"hb_node_may_be_down", hb_node_may_be_down, 203},
    {"hb_node_is_down", hb_node_is_down, 204},
    {"hb_notify_node_down", [](Hb_Node_Number node) { return hb_notify_node_down(node, HB_ADAPTER_IS_DOWN); }, 206},
};

const auto name_of_report = [](const auto& test) { return std::string(test.param.name); };

template <typename Number>
class ReportAbout : public Steering, public testing::WithParamInterface<Report<Number>> {
 protected:
  explicit ReportAbout(const ConfigurationMessage& configuration = sparse_cluster()) : Steering(configuration) {}

  using testing::WithParamInterface<Report<Number>>::GetParam;

  testing::AssertionResult is_refused_with(int error, Number number) {
    return refuses(error, [&] { return GetParam().call(number); });
  }

  // The daemon reads meanwhile: no socket holds the largest requests.
  testing::AssertionResult reports(Number number) {
    const Bytes expected = request_with_number(GetParam().code, static_cast<int32_t>(number));
    Bytes received;
    daemon.run([&](FakeDaemon&) { received = connection.receive_raw(expected.size()); });
    const testing::AssertionResult result = succeeds([&] { return GetParam().call(number); });
    daemon.join();
    if (!result || received == expected) {
      return result ? nothing_sent() : result;
    }
    return testing::AssertionFailure() << "another request was sent";
  }
};

class AdapterReport : public ReportAbout<Hb_Adapter_Number> {
 protected:
  using ReportAbout::ReportAbout;
};

TEST_P(AdapterReport, NamesAnyConfiguredAdapterOfTheCluster) {
  for (const Hb_Adapter_Number adapter : {13U, 0U, 12U, 17U, 2U}) {
    EXPECT_TRUE(reports(adapter)) << adapter;
  }
}

TEST_P(AdapterReport, OfANumberBeyondTheClusterIsInvalid) {
  for (const Hb_Adapter_Number adapter : {32U, 0x80000000U, 0xFFFFFFFFU}) {
    EXPECT_TRUE(is_refused_with(4, adapter)) << adapter;
  }
}

TEST_P(AdapterReport, OfAnUnknownAdapterFindsNone) {
  for (const Hb_Adapter_Number adapter : {1U, 14U, 31U}) {
    EXPECT_TRUE(is_refused_with(7, adapter)) << adapter;
  }
}

INSTANTIATE_TEST_SUITE_P(Control, AdapterReport, testing::ValuesIn(adapter_reports), name_of_report);

class NodeReport : public ReportAbout<Hb_Node_Number> {
 protected:
  using ReportAbout::ReportAbout;
};

TEST_P(NodeReport, NamesAnyNodeWithAdapters) {
  for (const Hb_Node_Number node : std::initializer_list<Hb_Node_Number>{0, 3, 4}) {
    EXPECT_TRUE(reports(node)) << node;
  }
}

TEST_P(NodeReport, OfANumberBeyondTheClusterIsInvalid) {
  for (const Hb_Node_Number node : std::initializer_list<Hb_Node_Number>{-1, 8, -32768, 32767}) {
    EXPECT_TRUE(is_refused_with(4, node)) << node;
  }
}

TEST_P(NodeReport, OfANodeWithoutAdaptersFindsNone) {
  for (const Hb_Node_Number node : std::initializer_list<Hb_Node_Number>{1, 2, 5, 7}) {
    EXPECT_TRUE(is_refused_with(9, node)) << node;
  }
}

TEST_P(NodeReport, GoesByTheTableOfNodes) {
  global_node_tbl[1] = Hb_True;
  EXPECT_TRUE(reports(1));
  global_node_tbl[3] = Hb_False;
  EXPECT_TRUE(is_refused_with(9, 3));
}

INSTANTIATE_TEST_SUITE_P(Control, NodeReport, testing::ValuesIn(node_reports), name_of_report);

// The largest cluster there is.
ConfigurationMessage huge_cluster() {
  return ConfigurationMessage()
      .local_node(0)
      .max_nodes(2049)
      .adapters_per_node(48)
      .adapter(5, "10.0.0.1")
      .adapter(16460, "10.0.0.2")
      .adapter(16461, "10.0.0.3")
      .adapter(98351, "10.0.0.4")
      .network("net0");
}

class AdapterReportInAHugeCluster : public AdapterReport {
 protected:
  AdapterReportInAHugeCluster() : AdapterReport(huge_cluster()) {}
};

TEST_P(AdapterReportInAHugeCluster, SendsAsManyZeroBytesAsItsNumberSays) {
  for (const Hb_Adapter_Number adapter : {5U, 16460U, 16461U, 98351U}) {
    EXPECT_TRUE(reports(adapter)) << adapter;
  }
}

TEST_P(AdapterReportInAHugeCluster, EndsWithItsLastNumber) {
  EXPECT_TRUE(is_refused_with(7, 98350));
  EXPECT_TRUE(is_refused_with(4, 98352));
}

INSTANTIATE_TEST_SUITE_P(Control, AdapterReportInAHugeCluster, testing::ValuesIn(adapter_reports), name_of_report);

class NodeReportInAHugeCluster : public NodeReport {
 protected:
  NodeReportInAHugeCluster() : NodeReport(huge_cluster()) {}
};

TEST_P(NodeReportInAHugeCluster, SendsAsManyZeroBytesAsItsNumberSays) {
  EXPECT_TRUE(reports(2048));
  EXPECT_TRUE(is_refused_with(9, 2047));
  EXPECT_TRUE(is_refused_with(4, 2049));
}

INSTANTIATE_TEST_SUITE_P(Control, NodeReportInAHugeCluster, testing::ValuesIn(node_reports), name_of_report);

class ReportFromASmallCluster : public Steering {
 protected:
  ReportFromASmallCluster() : Steering(small_cluster()) {}
};

TEST_F(ReportFromASmallCluster, OfAdapter5Is81BytesLong) {
  EXPECT_TRUE(succeeds([] { return hb_adapter_is_down(5); }));
  const Bytes frame = connection.receive_raw(4 + 81);
  EXPECT_FALSE(connection.has_input());
  EXPECT_EQ(81, i32_at(frame, 0));
  EXPECT_EQ(206, i32_at(frame, 4 + 8));
  EXPECT_EQ(5, i32_at(frame, 4 + 12));
  EXPECT_EQ(Bytes(5, '\0'), frame.substr(4 + 76));
}

TEST_F(ReportFromASmallCluster, OfANumberThatIsZeroHasNoData) {
  EXPECT_TRUE(succeeds([] { return hb_adapter_may_be_down(0); }));
  EXPECT_TRUE(sent(request_without_data(205)));
  EXPECT_TRUE(succeeds([] { return hb_node_may_be_down(0); }));
  EXPECT_TRUE(sent(request_without_data(203)));
}

TEST_F(ReportFromASmallCluster, WithoutMemoryIsNotSent) {
  Hb_Rc result = Hb_Success;
  {
    const AllocationFailure failure(1);
    result = hb_adapter_is_down(5);
  }
  EXPECT_EQ(Hb_Failure, result);
  EXPECT_EQ(17, hb_get_errno());
  EXPECT_TRUE(nothing_sent());
}

}  // namespace
}  // namespace hb_test
