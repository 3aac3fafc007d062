// The real lumeris-fileservice, spoken to over its socket with raw frames.
#include <sys/stat.h>

#include <fstream>

#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

// --- Replies -------------------------------------------------------------------------------

// An unknown search sub-command answers with only "transactionID", read as a uint64 or 0.
TEST_F(ServiceTest, UnknownSearchAnswersOnlyTheTransactionIdAsUint64) {
  struct Case {
    const char* name;
    std::optional<MessageValue> sent;
    std::uint64_t echoed;
  };
  const Case cases[] = {
      {"absent", std::nullopt, 0},
      {"small", MessageValue::Uint64(5), 5},
      {"largest", MessageValue::Uint64(UINT64_MAX), UINT64_MAX},
      {"negative", MessageValue::Int64(-3), 0},
      {"string", MessageValue::String("5"), 0},
      {"double", MessageValue::Double(5.0), 0},
  };
  for (const Case& c : cases) {
    MessageValue request = Command("search_xyz", {{"string", MessageValue::String("a")}});
    if (c.sent) request.Set("transactionID", *c.sent);
    std::optional<MessageValue> reply = sendRequest(request);
    ASSERT_TRUE(reply) << c.name;
    EXPECT_EQ(*reply, MessageValue::MakeDictionary(
                          {{"transactionID", MessageValue::Uint64(c.echoed)}})) << c.name;
  }
}

TEST_F(ServiceTest, CommandsThatNeverAnswerSendNothing) {
  // Writing commands, and commands no row of the table matches.
  for (const char* command : {"set", "settle", "set_skintone", "set_skintones", "add", "adder",
                              "save_state", "search", "Search_xyz", "", "unknown"}) {
    SCOPED_TRACE(command);
    expectNoReply(Command(command, {{"target", MessageValue::String("recents")},
                                    {"array", MessageValue::MakeArray()}}));
  }
  expectNoReply(MessageValue::MakeDictionary());  // no "command" at all
  expectNoReply(MessageValue::MakeDictionary({{"command", MessageValue::Uint64(1)}}));
}

// A batch in one write: every third message wants no reply and gets none; the others are
// answered in arrival order.
TEST_F(ServiceTest, RepliesFollowArrivalOrderAndSkipMessagesWantingNoReply) {
  RawConnection connection = Connect();
  std::string batch;
  for (std::uint64_t id = 1; id <= 60; ++id) {
    const FrameKind kind = id % 3 == 0 ? FrameKind::kNoReply : FrameKind::kWantsReply;
    AppendEncodedFrame(
        Frame{kind, id, Command("search_x", {{"transactionID", MessageValue::Uint64(id)}})}, batch);
  }
  ASSERT_TRUE(connection.SendBytes(batch));
  for (std::uint64_t id = 1; id <= 60; ++id) {
    if (id % 3 == 0) continue;
    std::optional<MessageValue> reply = connection.ReadReply(id);
    ASSERT_TRUE(reply) << id;
    EXPECT_EQ(reply->GetUint64("transactionID"), id);
  }
  EXPECT_FALSE(connection.ReadFrame(200ms));
}

// --- Malformed input -----------------------------------------------------------------------

std::string Envelope(std::string_view body) { return std::string("\x93\x01\x01", 3) + std::string(body); }

std::string Nested(int depth) {
  std::string bytes;
  for (int i = 0; i < depth; ++i) bytes += '\x91';
  return bytes + '\xc0';
}

// bin32 header of `size` bytes under key "a", in a full envelope.
std::string BinFrame(std::uint32_t size) {
  std::string header = Envelope(std::string("\x81\xa1" "a" "\xc6", 4));
  for (int shift = 24; shift >= 0; shift -= 8) header += static_cast<char>((size >> shift) & 0xff);
  return header + std::string(size, 'x');
}

TEST_F(ServiceTest, MalformedFrameEndsOnlyThatConnection) {
  const std::string whole = EncodeFrame(Frame{FrameKind::kWantsReply, 1, Command("search_x")});
  struct Case {
    const char* name;
    std::string bytes;
    bool then_close_writing = false;
  };
  const Case cases[] = {
      {"never-used byte", std::string("\xc1", 1)},
      {"top level not an array", EncodeMessageValue(Command("search_x"))},
      {"envelope of two", std::string("\x92\x01\x80", 3)},
      {"unknown kind", std::string("\x93\x03\x01\x80", 4)},
      {"negative id", std::string("\x93\x01\xff\x80", 4)},
      {"body not a map", std::string("\x93\x01\x01\x90", 4)},
      {"integer key", Envelope(std::string("\x81\x01\x02", 3))},
      {"array key", Envelope(std::string("\x81\x90\x02", 3))},
      {"ext value", Envelope(std::string("\x81\xa1" "a" "\xd4\x01\x00", 6))},
      {"too deep", Envelope(std::string("\x81\xa1" "a", 3) + Nested(63))},
      // Sent in full; the service stops reading at 16 MiB.
      {"over 16 MiB", BinFrame(17u << 20)},
      {"peer closes mid-frame", whole.substr(0, whole.size() / 2), true},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    RawConnection bad = Connect();
    bad.SendBytes(c.bytes);
    if (c.then_close_writing) bad.CloseWriting();
    EXPECT_TRUE(bad.WaitForPeerClose());
    EXPECT_TRUE(sendRequest(Command("search_x"))) << "service stopped serving";
  }
  // Envelope and body count as two of the 64 containers: 62 more are accepted.
  RawConnection deep = Connect();
  ASSERT_TRUE(deep.SendBytes(
      Envelope(std::string("\x82\xa7" "command" "\xa7" "search_" "\xa1" "a") + Nested(62))));
  EXPECT_TRUE(deep.ReadReply(1));
}

TEST_F(ServiceTest, CompleteFramesBeforeGarbageAreStillAnswered) {
  RawConnection connection = Connect();
  ASSERT_TRUE(connection.SendBytes(
      EncodeFrame(Frame{FrameKind::kWantsReply, 4, Command("search_x")}) + "\xc1"));
  EXPECT_TRUE(connection.ReadReply(4));
  EXPECT_TRUE(connection.WaitForPeerClose());
}

// --- Peers and the socket file -------------------------------------------------------------

TEST_F(ServiceTest, PeerOfAnotherUidIsRefused) {
  if (geteuid() != 0) GTEST_SKIP() << "needs root to run a client under another uid";
  // Let uid 65534 reach the socket, so that only the service's own check stands in its way.
  for (std::filesystem::path dir = socket_path_.parent_path(); dir != "/" && dir != "/tmp";
       dir = dir.parent_path()) {
    chmod(dir.c_str(), 0711);
  }
  chmod(socket_path_.c_str(), 0666);
  const std::string command = std::string("setpriv --reuid=65534 --regid=65534 --clear-groups ") +
                              LUMERIS_TEST_PEER_PROBE + " " + socket_path_.string();
  FILE* probe = popen(command.c_str(), "r");
  ASSERT_TRUE(probe);
  char line[64] = {};
  ASSERT_TRUE(fgets(line, sizeof line, probe));
  pclose(probe);
  EXPECT_STREQ(line, "closed\n");
  EXPECT_TRUE(sendRequest(Command("search_x"))) << "the service's own user is still served";
}

TEST_F(ServiceTest, TerminationRemovesTheSocketItBound) {
  for (int signal_number : {SIGTERM, SIGINT}) {
    SCOPED_TRACE(signal_number);
    if (service_.Exited()) {
      ASSERT_TRUE(service_.Start(socket_path_));
    }
    const int status = service_.Stop(signal_number);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << status;
    EXPECT_FALSE(std::filesystem::exists(socket_path_));
  }
}

TEST_F(ServiceTest, SecondServiceDoesNotTakeOverALiveSocket) {
  ServiceProcess second;
  EXPECT_FALSE(second.Start(socket_path_ / "unused"));
  EXPECT_TRUE(second.Exited());
  EXPECT_TRUE(sendRequest(Command("search_x")));
}

TEST_F(ServiceTest, StaleSocketIsReplacedAndAnyOtherFileLeftAlone) {
  service_.Stop(SIGKILL);  // leaves a socket file nobody listens on
  ASSERT_TRUE(std::filesystem::exists(socket_path_));
  ASSERT_TRUE(service_.Start(socket_path_));
  EXPECT_TRUE(sendRequest(Command("search_x")));

  service_.Stop();
  std::ofstream(socket_path_) << "keep me";
  EXPECT_FALSE(service_.Start(socket_path_));
  std::ifstream kept(socket_path_);
  std::string content;
  std::getline(kept, content);
  EXPECT_EQ(content, "keep me");
}

// --- Socket activation ---------------------------------------------------------------------

// A "Key=value" line of a unit file.
std::string UnitValue(const std::filesystem::path& unit, const std::string& key) {
  std::ifstream in(unit);
  std::string line;
  while (std::getline(in, line)) {
    if (line.rfind(key + "=", 0) == 0) return line.substr(key.size() + 1);
  }
  return {};
}

TEST(SocketActivation, ShippedUnitsStartTheServiceOnTheFirstConnection) {
  IsolatedUserEnvironment environment;
  const std::filesystem::path units = LUMERIS_TEST_UNITS_DIR;
  std::string listen = UnitValue(units / "com.vantorel.Lumeris.FileService.socket", "ListenStream");
  const std::string exec = UnitValue(units / "com.vantorel.Lumeris.FileService.service", "ExecStart");
  ASSERT_EQ(listen.rfind("%t/", 0), 0u) << listen;
  EXPECT_EQ(std::filesystem::path(exec).filename(), FileServiceProgram().filename());
  // %t is the user's runtime directory; the unit must name the path clients look for.
  const std::filesystem::path socket_path =
      environment.runtime_dir() / std::filesystem::path(listen.substr(3));
  ASSERT_EQ(socket_path, *ServiceSocketPath());

  ServiceProcess activator;
  ASSERT_TRUE(activator.Start(socket_path, {"systemd-socket-activate", "-l", socket_path.string(),
                                            FileServiceProgram().string()}));
  std::optional<RawConnection> connection = RawConnection::Open(socket_path);
  ASSERT_TRUE(connection);
  std::optional<MessageValue> reply = connection->ReadReply(
      connection->SendMessage(Command("search_x", {{"transactionID", MessageValue::Uint64(3)}})));
  ASSERT_TRUE(reply);
  EXPECT_EQ(reply->GetUint64("transactionID"), 3u);
  connection.reset();
  activator.Stop();
  // The socket belonged to systemd's stand-in, so the service did not remove it.
  EXPECT_TRUE(std::filesystem::exists(socket_path));
}

}  // namespace
}  // namespace lumeris::testing
