// The real lumeris-fileservice over its socket: the wiring of wire, dispatch and runtime (the rules
// behind each row are shown in their own tests), and the process's socket file.
#include <sys/stat.h>

#include <fstream>

#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

MessageValue Uint(std::uint64_t n) { return MessageValue::Uint64(n); }

// One batch in one write: only reading commands sent wanting a reply are answered, in order, so
// the last row's reply comes last.
TEST_F(ServiceTest, OnlyReadingCommandsWantingAReplyAreAnsweredInArrivalOrder) {
  const struct { FrameKind kind; MessageValue body; std::optional<MessageValue> reply; } rows[] = {
      {FrameKind::kWantsReply, Command("search_x", {{"transactionID", Uint(UINT64_MAX)}}),
       MessageValue::MakeDictionary({{"transactionID", Uint(UINT64_MAX)}})},
      {FrameKind::kNoReply, Command("search_x"), std::nullopt},
      {FrameKind::kWantsReply, Command("read", {{"target", MessageValue::String("recents")}}),
       MessageValue::MakeDictionary({{"array", MessageValue::Null()}})},
      {FrameKind::kWantsReply, Command("set", {{"target", MessageValue::String("recents")}}), std::nullopt},
      {FrameKind::kWantsReply, Command("unknown"), std::nullopt},
      {FrameKind::kWantsReply, MessageValue::MakeDictionary(), std::nullopt},
      {FrameKind::kWantsReply, Command("search_x", {{"transactionID", Uint(2)}}),
       MessageValue::MakeDictionary({{"transactionID", Uint(2)}})},
  };
  RawConnection connection = Connect();
  std::string batch;
  for (std::uint64_t id = 1; const auto& row : rows) AppendEncodedFrame(Frame{row.kind, id++, row.body}, batch);
  ASSERT_TRUE(connection.SendBytes(batch));
  for (std::uint64_t id = 1; const auto& row : rows) {
    // Rows without a reply are not read: a reply to one would come before the next row's.
    EXPECT_EQ(row.reply ? connection.ReadReply(id) : std::nullopt, row.reply) << row.body;
    ++id;
  }
}

TEST_F(ServiceTest, MalformedOrCutFrameEndsOnlyItsConnectionAfterTheWholeFramesBeforeIt) {
  const std::string whole = EncodeFrame(Frame{FrameKind::kWantsReply, 1, Command("search_x")});
  const struct { const char* name; std::string bytes; bool close_writing; } rows[] = {
      {"never-used byte", whole + "\xc1", false},
      {"peer closes mid-frame", whole + whole.substr(0, whole.size() / 2), true}};
  for (const auto& row : rows) {
    SCOPED_TRACE(row.name);
    RawConnection bad = Connect();
    ASSERT_TRUE(bad.SendBytes(row.bytes));
    if (row.close_writing) bad.CloseWriting();
    EXPECT_TRUE(bad.ReadReply(1));
    EXPECT_TRUE(bad.WaitForPeerClose());
    EXPECT_TRUE(sendRequest(Command("search_x"))) << "service stopped serving";
  }
}

// The socket file is the user's alone, never taken from a live service, replaced when stale,
// removed at a clean end; any other file in its place is left alone.
TEST_F(ServiceTest, SocketFileIsPrivateAndBelongsToTheLiveService) {
  struct stat st {};
  ASSERT_EQ(lstat(socket_path_.c_str(), &st), 0);
  EXPECT_TRUE(S_ISSOCK(st.st_mode));
  EXPECT_EQ(st.st_mode & 07777, 0600u) << "group or others may connect";
  EXPECT_EQ(st.st_uid, geteuid());

  ServiceProcess second;
  EXPECT_FALSE(second.Start(socket_path_ / "unused"));
  EXPECT_TRUE(second.Exited()) << "a second service took over a live socket";
  EXPECT_TRUE(sendRequest(Command("search_x")));

  for (int signal_number : {SIGTERM, SIGINT}) {
    ASSERT_TRUE(!service_.Exited() || service_.Start(socket_path_));
    const int status = service_.Stop(signal_number);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << signal_number << ": " << status;
    EXPECT_FALSE(std::filesystem::exists(socket_path_)) << signal_number;
  }
  ASSERT_TRUE(service_.Start(socket_path_));
  service_.Stop(SIGKILL);  // leaves a socket file nobody listens on
  ASSERT_TRUE(std::filesystem::exists(socket_path_));
  ASSERT_TRUE(service_.Start(socket_path_));
  EXPECT_TRUE(sendRequest(Command("search_x")));

  service_.Stop();
  std::ofstream(socket_path_) << "keep me";
  EXPECT_FALSE(service_.Start(socket_path_));
  std::string kept;
  std::getline(std::ifstream(socket_path_), kept);
  EXPECT_EQ(kept, "keep me");
}

// A "Key=value" line of a unit file.
std::string UnitValue(const std::filesystem::path& unit, const std::string& key) {
  std::ifstream in(unit);
  for (std::string line; std::getline(in, line);) {
    if (line.rfind(key + "=", 0) == 0) return line.substr(key.size() + 1);
  }
  return {};
}

TEST(SocketActivation, ShippedUnitsStartTheServiceOnThePrivateSocketClientsUse) {
  IsolatedUserEnvironment environment;
  const std::filesystem::path units = LUMERIS_TEST_UNITS_DIR;
  const std::filesystem::path socket_unit = units / "com.vantorel.Lumeris.FileService.socket";
  const std::string listen = UnitValue(socket_unit, "ListenStream");
  const std::string exec = UnitValue(units / "com.vantorel.Lumeris.FileService.service", "ExecStart");
  EXPECT_EQ(listen, "%t/com.vantorel.Lumeris.FileService");  // %t: the user's runtime directory
  EXPECT_EQ(UnitValue(socket_unit, "SocketMode"), "0600");
  EXPECT_EQ(std::filesystem::path(exec).filename(), "lumeris-fileservice");
  const std::filesystem::path socket_path = environment.runtime_dir() / "com.vantorel.Lumeris.FileService";
  ASSERT_EQ(socket_path, *ServiceSocketPath());

  ServiceProcess activator;
  ASSERT_TRUE(activator.Start(socket_path, {"systemd-socket-activate", "-l", socket_path.string(),
                                            FileServiceProgram().string()}));
  std::optional<RawConnection> connection = RawConnection::Open(socket_path);
  ASSERT_TRUE(connection);
  std::optional<MessageValue> reply =
      connection->ReadReply(connection->SendMessage(Command("search_x", {{"transactionID", Uint(3)}})));
  ASSERT_TRUE(reply);
  EXPECT_EQ(reply->GetUint64("transactionID"), 3u);
  connection.reset();
  activator.Stop();
  EXPECT_TRUE(std::filesystem::exists(socket_path)) << "the service removed systemd's socket";
}

}  // namespace
}  // namespace lumeris::testing
