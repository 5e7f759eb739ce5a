/* What the daemon does with each request, and with what is none. */
#include <gmock/gmock.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstring>
#include <memory>

#include "scripted_daemon.h"

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

const std::string one_death = "[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 0\noffset = 1\n";

struct Accepted {
  std::uint32_t request;
  std::size_t data;
};

void PrintTo(const Accepted& each, std::ostream* out) { *out << each.request; }

class UnansweredRequest : public testing::TestWithParam<Accepted> {};

TEST_P(UnansweredRequest, is_accepted_in_silence) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.send(request(GetParam().request, Bytes(GetParam().data)));
  const auto next = client.configuration();
  ASSERT_TRUE(next);
  EXPECT_EQ(field(*next, 0), 0U);
}

INSTANTIATE_TEST_SUITE_P(EachOfThem, UnansweredRequest,
                         testing::Values(Accepted{202, 0}, Accepted{203, 3}, Accepted{204, 0}, Accepted{205, 7},
                                         Accepted{206, 98351}, Accepted{207, 2}, Accepted{208, 2}, Accepted{212, 2},
                                         Accepted{213, 2}, Accepted{217, 4}, Accepted{219, 0}, Accepted{220, 0},
                                         Accepted{222, 4}, Accepted{224, 0}, Accepted{225, 3}, Accepted{226, 0},
                                         Accepted{227, 0}),
                         [](const auto& each) { return std::to_string(each.param.request); });

TEST(DelayedShutdown, comes_when_the_last_client_has_left) {
  ScriptedDaemon daemon;
  auto leaving = std::make_unique<Connection>(daemon.socket());
  auto staying = std::make_unique<Connection>(daemon.socket());
  ASSERT_TRUE(staying->configuration());
  leaving->send(request(227, {}));
  ASSERT_TRUE(leaving->configuration());
  leaving.reset();
  ASSERT_TRUE(staying->configuration());
  {
    Connection late(daemon.socket());
    ASSERT_TRUE(late.configuration());
  }
  ASSERT_TRUE(staying->configuration());
  staying.reset();
  EXPECT_EQ(daemon.process().wait_for_end(), 0);
  EXPECT_THAT(daemon.process().log(), testing::HasSubstr("asks for a shutdown when the last client has left"));
  EXPECT_NE(access(daemon.socket().c_str(), F_OK), 0);
}

TEST(Request, that_arrives_byte_by_byte_is_served) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  for (const auto byte : request(201, {})) {
    client.send({byte});
  }
  const auto answer = client.receive();
  ASSERT_TRUE(answer);
  EXPECT_EQ(field(*answer, 0), 0U);
}

TEST(Request, that_arrives_with_others_in_one_piece_is_served_in_order) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.send(ByteWriter().raw(request(223, Bytes(2))).raw(request(201, {})).raw(request(216, Bytes(8))).bytes());
  for (const std::uint32_t kind : {14U, 0U, 11U}) {
    const auto answer = client.receive();
    ASSERT_TRUE(answer);
    EXPECT_EQ(field(*answer, 0), kind);
  }
}

TEST(Subscribing, under_several_names_brings_an_event_once_for_each) {
  ScriptedDaemon daemon(one_death, 3);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 1, "first");
  client.subscribe(SubscriptionType::AllAdapters, 1, "second");
  daemon.go(client);
  const auto packets = daemon.packets(client);
  ASSERT_THAT(kinds_of(packets), ElementsAre(2, 2));
  EXPECT_EQ(text_field(packets[0], 24), "first");
  EXPECT_EQ(text_field(packets[1], 24), "second");
}

TEST(Subscribing, again_under_a_name_replaces_what_was_there) {
  ScriptedDaemon daemon(one_death);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 1, "s");
  client.subscribe(SubscriptionType::AllNodes, 1, "s");
  daemon.go(client);
  EXPECT_THAT(daemon.packets(client), IsEmpty());
}

TEST(Subscribing, under_one_name_by_two_clients_serves_both) {
  ScriptedDaemon daemon(one_death, 4);
  Connection first(daemon.socket());
  Connection second(daemon.socket());
  for (Connection* client : {&first, &second}) {
    client->subscribe(SubscriptionType::AllAdapters, 1, "s");
    daemon.go(*client);
  }
  const auto of_first = daemon.packets(first);
  EXPECT_THAT(kinds_of(of_first), ElementsAre(2));
  EXPECT_EQ(daemon.packets(second), of_first);
}

TEST(Subscribing, under_a_name_of_31_characters_brings_it_back_whole) {
  ScriptedDaemon daemon(one_death);
  Connection client(daemon.socket());
  const std::string name = "a name that has 31 characters..";
  client.subscribe(SubscriptionType::AllAdapters, 1, name);
  daemon.go(client);
  EXPECT_EQ(text_field(daemon.packets(client).at(0), 24), name);
}

TEST(Unsubscribing, ends_the_events_of_that_name_alone) {
  ScriptedDaemon daemon(one_death, 3);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 1, "kept");
  client.send(request(210, {'n', 'o', 'n', 'e', 0}));
  client.subscribe(SubscriptionType::AllAdapters, 1, "gone");
  client.send(request(210, {'g', 'o', 'n', 'e', 0}));
  client.subscribe(SubscriptionType::DifferentInstance, 0x100, "third");
  daemon.go(client);
  const auto packets = daemon.packets(client);
  ASSERT_THAT(kinds_of(packets), ElementsAre(2));
  EXPECT_EQ(text_field(packets[0], 24), "kept");
}

struct Malformed {
  std::string name;
  Bytes bytes;
  std::string complaint;
};

void PrintTo(const Malformed& each, std::ostream* out) { *out << each.name; }

Bytes prefix(std::uint32_t length) { return ByteWriter().u32(length).bytes(); }

Bytes with_length_field(std::uint32_t code, std::uint32_t length, std::size_t data) {
  Bytes bytes = request(code, Bytes(data));
  std::memcpy(bytes.data() + 16, &length, sizeof(length));
  return bytes;
}

class MalformedRequest : public testing::TestWithParam<Malformed> {};

TEST_P(MalformedRequest, disconnects_its_sender_alone_and_is_logged) {
  ScriptedDaemon daemon;
  Connection innocent(daemon.socket());
  Connection sender(daemon.socket());
  sender.send(GetParam().bytes);
  EXPECT_TRUE(sender.is_ended());
  const auto answer = innocent.configuration();
  ASSERT_TRUE(answer);
  EXPECT_EQ(field(*answer, 0), 0U);
  EXPECT_THAT(daemon.process().log(), HasSubstr(GetParam().complaint + "; disconnected"));
}

INSTANTIATE_TEST_SUITE_P(
    Of, MalformedRequest,
    testing::Values(
        Malformed{"length_0", prefix(0), "sent a packet length of 0"},
        Malformed{"length_75", prefix(75), "sent a packet length of 75"},
        Malformed{"length_beyond_the_most", prefix(98428), "sent a packet length of 98428"},
        Malformed{"negative_length", prefix(0xFFFFFFFF), "sent a packet length of -1"},
        Malformed{"code_0", request(0, {}), "the unknown request 0"},
        Malformed{"code_200", request(200, {}), "the unknown request 200"},
        Malformed{"code_228", request(228, {}), "the unknown request 228"},
        Malformed{"len_unlike_the_frame", with_length_field(201, 1, 0),
                  "request 201 with a length of 1 and 0 bytes of data"},
        Malformed{"negative_len", with_length_field(203, 0xFFFFFFFF, 4),
                  "request 203 with a length of -1 and 4 bytes of data"},
        Malformed{"data_where_none_belong", request(201, Bytes(4)),
                  "request 201 with 4 bytes of data; 0 to 0 are allowed"},
        Malformed{"too_little_data", request(214, Bytes(2)), "request 214 with 2 bytes of data; 8 to 8 are allowed"},
        Malformed{"more_data_than_a_message_holds", request(221, Bytes(16461)),
                  "request 221 with 16461 bytes of data; 0 to 16460 are allowed"},
        Malformed{"routed_message_of_zeros", request(221, Bytes(9064)), "sent a routed message of version 0"},
        Malformed{"short_subscription", request(209, Bytes(12347)),
                  "request 209 with 12347 bytes of data; 12348 to 12348 are allowed"},
        Malformed{"empty_subscription", request(209, subscription(SubscriptionType::Empty, 7, "s")),
                  "a subscription of type 4"},
        Malformed{"subscription_of_type_10", request(209, subscription(static_cast<SubscriptionType>(10), 7, "s")),
                  "a subscription of type 10"},
        Malformed{"name_without_terminator", request(210, {'a', 'b'}), "a name without its terminator"},
        Malformed{"name_too_long", request(210, Bytes(33)), "request 210 with 33 bytes of data; 1 to 32 are allowed"}),
    [](const auto& each) { return each.param.name; });

TEST(Client, that_leaves_in_the_middle_of_a_request_disturbs_nobody) {
  ScriptedDaemon daemon;
  Connection stays(daemon.socket());
  {
    const Connection leaves(daemon.socket());
    const Bytes whole = request(209, subscription(SubscriptionType::AllNodes, 7, "s"));
    leaves.send(Bytes(whole.begin(), whole.begin() + 100));
  }
  EXPECT_TRUE(stays.configuration());
}

TEST(Client, that_asks_and_leaves_without_reading_disturbs_nobody) {
  ScriptedDaemon daemon;
  Connection stays(daemon.socket());
  for (int i = 0; i < 20; ++i) {
    const Connection leaves(daemon.socket());
    leaves.send(request(201, {}));
  }
  EXPECT_TRUE(stays.configuration());
  EXPECT_EQ(daemon.process().stop(), 0);
}

}  // namespace
