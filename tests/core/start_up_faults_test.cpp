// Starts against a daemon that goes away, answers nonsense or publishes too little, and starts without memory.
#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "hb_communication/connection.h"
#include "support/allocation_faults.h"
#include "support/process_state.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

class FaultyStart : public testing::Test {
 protected:
  FaultyStart() {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
    set_hb_errno(0);
  }
  ~FaultyStart() override { hb_terminate(); }

  // Starts against a daemon that does this with the connection once it has read the request.
  int error_with(const std::function<void(DaemonConnection&)>& answer) {
    FakeDaemon daemon;
    daemon.run([&answer](FakeDaemon& self) {
      DaemonConnection connection = self.accept();
      connection.receive_request();
      answer(connection);
    });
    return error_of_start(daemon);
  }

  int error_with(const Publication& publication) {
    FakeDaemon daemon(publication);
    return error_of_start(daemon);
  }

  int error_of_start(FakeDaemon& daemon) {
    const LeakAllowed connection_stays;
    EXPECT_EQ(hb_init(), Hb_Failure);
    EXPECT_EQ(client_initialized, Hb_False);
    daemon.join();
    return hb_get_errno();
  }
};

TEST_F(FaultyStart, NoDaemon) {
  FakeDaemon daemon;
  daemon.stop_listening();
  const int descriptors = open_descriptors();
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
  EXPECT_EQ(open_descriptors(), descriptors);
  EXPECT_EQ(client_socket, nullptr);
}

TEST_F(FaultyStart, NoSocketFile) {
  setenv("HB_SERVER_SOCKET", "/nonexistent/socket", 1);
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
}

TEST_F(FaultyStart, DaemonGoneBeforeTheAnswer) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) { connection.close(); }), 16);
}

TEST_F(FaultyStart, DaemonGoneInsideTheLength) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) { connection.send_raw(std::string(2, '\0')); }), 16);
}

TEST_F(FaultyStart, DaemonGoneBetweenLengthAndBody) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) { connection.send_raw(ByteBuilder().u32(400).bytes()); }), 16);
}

TEST_F(FaultyStart, DaemonGoneInsideTheBody) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) {
              const Bytes answer = framed(configuration_answer(small_cluster()));
              connection.send_raw(answer.substr(0, answer.size() - 1));
            }),
            16);
}

TEST_F(FaultyStart, AnswerOfLengthZeroIsNoConfiguration) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) { connection.send_frame(""); }), 10);
}

TEST_F(FaultyStart, AnswerOfAnotherKind) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) {
              connection.send_frame(ReplyPacket(9).message(small_cluster().bytes()).bytes());
            }),
            10);
}

TEST_F(FaultyStart, AnswerWithANegativeLength) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) { connection.send_raw(ByteBuilder().i32(-1).bytes()); }), 27);
}

TEST_F(FaultyStart, AnswerThatClaimsMoreAdaptersThanItHolds) {
  EXPECT_EQ(error_with([](DaemonConnection& connection) {
              connection.send_frame(configuration_answer(small_cluster().claim_adapters(8)));
            }),
            10);
}

TEST_F(FaultyStart, AnswerByteByByteIsGoodEnough) {
  FakeDaemon daemon;
  daemon.run([](FakeDaemon& self) {
    DaemonConnection connection = self.accept();
    connection.receive_request();
    connection.send_byte_by_byte(framed(configuration_answer(small_cluster())));
  });
  EXPECT_EQ(hb_init(), Hb_Success);
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 6);
  daemon.join();
}

// Publications that lack something.

TEST_F(FaultyStart, NothingPublished) { EXPECT_EQ(error_with(Publication::none()), 33); }

TEST_F(FaultyStart, NoConfigurationSegment) {
  Publication publication;
  publication.configuration_segment = false;
  EXPECT_EQ(error_with(publication), 33);
}

TEST_F(FaultyStart, NoRouteSegment) {
  Publication publication;
  publication.route_segment = false;
  EXPECT_EQ(error_with(publication), 33);
}

TEST_F(FaultyStart, NoSecuritySegment) {
  Publication publication;
  publication.security_segment = false;
  EXPECT_EQ(error_with(publication), 33);
}

TEST_F(FaultyStart, NoSemaphores) {
  Publication publication;
  publication.semaphores = false;
  EXPECT_EQ(error_with(publication), 45);
}

TEST_F(FaultyStart, ConfigurationSegmentTooSmall) {
  Publication publication;
  publication.configuration_size = 11;
  EXPECT_EQ(error_with(publication), 32);
}

TEST_F(FaultyStart, RouteSegmentSmallerThanTheNodesNeed) {
  Publication publication;
  publication.nodes = 4;
  publication.route_size = 4 * 184 - 1;
  EXPECT_EQ(error_with(publication), 32);
}

TEST_F(FaultyStart, SecuritySegmentTooSmall) {
  Publication publication;
  publication.security_size = 3167;
  EXPECT_EQ(error_with(publication), 32);
}

TEST_F(FaultyStart, OneSemaphoreTooFew) {
  Publication publication;
  publication.semaphore_count = 1;
  EXPECT_EQ(error_with(publication), 44);
}

TEST_F(FaultyStart, SegmentsRemovedWhileAttachedStayReadable) {
  FakeDaemon daemon(Publication::for_nodes(3));
  const int segments = attached_segments();
  const DaemonConnection connection = start_client(daemon, small_cluster());
  for (const Segment segment : {Segment::configuration, Segment::route, Segment::security}) {
    daemon.remove_segment(segment);
  }
  daemon.remove_semaphores();
  EXPECT_EQ(data_for_client->number_of_nodes, 3U);
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_EQ(attached_segments(), segments);
}

// Memory that runs out at each allocation of a start in turn.

TEST_F(FaultyStart, WithoutMemoryFailsAndThrowsNothing) {
  hbc_initialize_trace_once();  // the platform's memory is not the library's
  bool happened = true;
  for (size_t nth = 1; happened; ++nth) {
    FakeDaemon daemon;
    daemon.serve_configuration(configuration_answer(small_cluster()));
    const LeakAllowed connection_stays;
    Hb_Rc rc = Hb_Success;
    {
      const AllocationFailure failure(nth);
      EXPECT_NO_THROW(rc = hb_init());
      happened = failure.happened();
    }
    EXPECT_EQ(rc, happened ? Hb_Failure : Hb_Success) << "allocation " << nth;
    if (happened) {
      EXPECT_TRUE(hb_get_errno() == 17 || hb_get_errno() == 27) << hb_get_errno() << " at allocation " << nth;
    } else {
      EXPECT_GT(nth, 6U);  // socket, selector, packet, list, tables ...
    }
  }
  hb_terminate();
}

}  // namespace
}  // namespace hb_test
