// Numbers and offsets of what crosses the socket and the shared memory.
#include <gtest/gtest.h>

#include <cstddef>

#include "hb_client/control.h"
#include "hb_protocol/framing.h"
#include "hb_protocol/replies.h"
#include "hb_protocol/requests.h"
#include "hb_protocol/shared_memory.h"

namespace hb_test {
namespace {

TEST(ProtocolValues, OfRequests) {
  EXPECT_EQ(HB_GET_CONFIG_INFO, 201);
  EXPECT_EQ(HB_GET_ADAPTER_GROUP, 202);
  EXPECT_EQ(HB_NODE_MAY_BE_DOWN, 203);
  EXPECT_EQ(HB_NODE_IS_DOWN, 204);
  EXPECT_EQ(HB_ADAPTER_MAY_BE_DOWN, 205);
  EXPECT_EQ(HB_ADAPTER_IS_DOWN, 206);
  EXPECT_EQ(HB_ENABLE_ADAPTER, 207);
  EXPECT_EQ(HB_DISABLE_ADAPTER, 208);
  EXPECT_EQ(HB_SUBSCRIBE, 209);
  EXPECT_EQ(HB_UNSUBSCRIBE, 210);
  EXPECT_EQ(HB_GET_ROUTE, 211);
  EXPECT_EQ(HB_IFCONFIG_DOWN, 212);
  EXPECT_EQ(HB_IFCONFIG_UP, 213);
  EXPECT_EQ(HB_CONFIGURE_ADAPTER, 214);
  EXPECT_EQ(HB_UNCONFIGURE_ADAPTER, 215);
  EXPECT_EQ(HB_ADAPTER_GRACE_REQ, 216);
  EXPECT_EQ(HB_SIMULATE_DEATH, 217);
  EXPECT_EQ(HB_SWAP_ADAPTERS, 218);
  EXPECT_EQ(HB_DISCARD_STALE_MESSAGES, 219);
  EXPECT_EQ(HB_DONT_DISCARD_STALE_MESSAGES, 220);
  EXPECT_EQ(HB_DAEMON_ROUTING_REQUEST, 221);
  EXPECT_EQ(HB_CLIENT_HEARTBEAT, 222);
  EXPECT_EQ(HB_GET_ADAPTER_STATE, 223);
  EXPECT_EQ(HB_SEND_CONFIG_INFO, 224);
  EXPECT_EQ(HB_ENABLE_MANUAL_CONTROL_NIMS, 225);
  EXPECT_EQ(HB_DISABLE_MANUAL_CONTROL_NIMS, 226);
  EXPECT_EQ(HB_DELAYED_DAEMON_SHUTDOWN, 227);
  EXPECT_EQ(MONITOR_LAST_MESSAGE, 227);
  EXPECT_EQ(sizeof(Hb_Client_Request), 4U);
}

TEST(ProtocolValues, OfReplies) {
  EXPECT_EQ(HB_CONFIGURATION_INFO, 0);
  EXPECT_EQ(HB_ADAPTER_GROUP, 1);
  EXPECT_EQ(HB_ADAPTER_DEATH, 2);
  EXPECT_EQ(HB_ADAPTER_JOIN, 3);
  EXPECT_EQ(HB_ADAPTER_NEW_GROUP, 4);
  EXPECT_EQ(HB_NODE_DEATH, 5);
  EXPECT_EQ(HB_NODE_JOIN, 6);
  EXPECT_EQ(HB_NODE_NEW_GROUP, 7);
  EXPECT_EQ(HB_ROUTE, 8);
  EXPECT_EQ(HB_CONFIGURATION_UPDATE, 9);
  EXPECT_EQ(HB_CONFIG_ADAPTER, 10);
  EXPECT_EQ(HB_ADAPTER_GRACE, 11);
  EXPECT_EQ(HB_FFDC_ID, 12);
  EXPECT_EQ(HB_DIFF_INSTANCE_NUM, 13);
  EXPECT_EQ(HB_ADAPTER_STATE, 14);
  EXPECT_EQ(HB_NODE_HEARTBEAT, 15);
  EXPECT_EQ(sizeof(Hb_Client_Reply), 4U);
}

TEST(ProtocolValues, OfRequestStates) {
  EXPECT_EQ(HB_REQUEST_SUCCESSFUL, 0);
  EXPECT_EQ(HB_NO_SUCH_NETWORK, 1);
  EXPECT_EQ(HB_TRY_AGAIN, 2);
  EXPECT_EQ(HB_ADAPTER_ENABLED, 3);
  EXPECT_EQ(HB_ADAPTER_NOT_CONFIG, 4);
  EXPECT_EQ(HB_INVALID_SERVICE_ADDRESS, 5);
  EXPECT_EQ(HB_SAME_ADDRESS, 6);
  EXPECT_EQ(HB_NOT_SUPPORTED, 7);
  EXPECT_EQ(HB_GRACE_FAILED, 8);
  EXPECT_EQ(HB_GRACE_TIME_OUT, 9);
}

TEST(ProtocolValues, OfGroupStates) {
  EXPECT_EQ(Hb_Group_Stable, 0);
  EXPECT_EQ(Hb_Group_Unstable, 1);
}

TEST(ProtocolLayout, OfRequests) {
  EXPECT_EQ(sizeof(packet_str), 16536U);
  EXPECT_EQ(offsetof(packet_str, Treceive), 0U);
  EXPECT_EQ(offsetof(packet_str, kind), 8U);
  EXPECT_EQ(offsetof(packet_str, len), 12U);
  EXPECT_EQ(offsetof(packet_str, vers.major), 16U);
  EXPECT_EQ(offsetof(packet_str, vers.minor), 18U);
  EXPECT_EQ(offsetof(packet_str, from_id), 20U);
  EXPECT_EQ(offsetof(packet_str, from_group), 28U);
  EXPECT_EQ(offsetof(packet_str, to_id), 36U);
  EXPECT_EQ(offsetof(packet_str, to_group), 44U);
  EXPECT_EQ(offsetof(packet_str, requestor), 52U);
  EXPECT_EQ(offsetof(packet_str, reserved), 56U);
  EXPECT_EQ(offsetof(packet_str, status), 60U);
  EXPECT_EQ(offsetof(packet_str, origin.client.pid), 64U);
  EXPECT_EQ(offsetof(packet_str, origin.client.sfd), 68U);
  EXPECT_EQ(offsetof(packet_str, origin.client.extra3), 72U);
  EXPECT_EQ(offsetof(packet_str, origin.server.machinesId), 64U);
  EXPECT_EQ(offsetof(packet_str, origin.server.fromOffset), 68U);
  EXPECT_EQ(offsetof(packet_str, origin.server.machinesInst), 72U);
  EXPECT_EQ(offsetof(packet_str, message), 76U);
  EXPECT_EQ(sizeof(packet_str::message), 16460U);
}

TEST(ProtocolLayout, OfReplies) {
  EXPECT_EQ(sizeof(client_packet), 6298816U);
  EXPECT_EQ(offsetof(client_packet, kind), 0U);
  EXPECT_EQ(offsetof(client_packet, leader_id), 4U);
  EXPECT_EQ(offsetof(client_packet, group_id), 12U);
  EXPECT_EQ(offsetof(client_packet, group_status), 20U);
  EXPECT_EQ(offsetof(client_packet, subscription_name), 24U);
  EXPECT_EQ(offsetof(client_packet, value), 56U);
  EXPECT_EQ(offsetof(client_packet, ffdc_id), 60U);
  EXPECT_EQ(sizeof(client_packet::ffdc_id), 43U);
  EXPECT_EQ(offsetof(client_packet, notification_sequence_no), 104U);
  EXPECT_EQ(offsetof(client_packet, message), 108U);
  EXPECT_EQ(sizeof(client_packet::message), 6298708U);
}

TEST(ProtocolLayout, OfTheHeartbeatSettings) {
  EXPECT_EQ(sizeof(Hb_client_hb_info_t), 16U);
  EXPECT_EQ(offsetof(Hb_client_hb_info_t, client_hb_is_enabled), 8U);
  EXPECT_EQ(offsetof(Hb_client_hb_info_t, client_hb_daemon_pid), 12U);
}

TEST(ProtocolLayout, OfTheFrame) {
  EXPECT_EQ(sizeof(hb_frame_length), 4U);
  EXPECT_EQ(HB_SOCKET_BUFFER_SIZE, 32768);
  EXPECT_EQ(HB_SOCKET_PATH_SIZE, 108);
}

TEST(ProtocolValues, OfKeysAndSemaphores) {
  EXPECT_EQ(HB_CONFIGURATION_SEGMENT_ID, 103);
  EXPECT_EQ(HB_ROUTE_SEGMENT_ID, 104);
  EXPECT_EQ(HB_SECURITY_SEGMENT_ID, 112);
  EXPECT_EQ(HB_SEMAPHORE_SET_ID, 105);
  EXPECT_EQ(HB_SEMAPHORE_COUNT, 2);
  EXPECT_EQ(HB_READERS_SEMAPHORE, 0);
  EXPECT_EQ(HB_WRITER_SEMAPHORE, 1);
}

TEST(ProtocolLayout, OfTheSegments) {
  EXPECT_EQ(sizeof(memory_configuration_data), 12U);
  EXPECT_EQ(sizeof(route_sequence), 184U);
  EXPECT_EQ(sizeof(route_sequence::ip_option), 176U);
  EXPECT_EQ(sizeof(security_information), 3168U);
  EXPECT_EQ(sizeof(Hb_Shared_Security_Status), 280U);
  EXPECT_EQ(sizeof(Hb_sec_buffer_desc), 260U);
  EXPECT_EQ(sizeof(Hb_Shared_Key_Cache), 2604U);
}

}  // namespace
}  // namespace hb_test
