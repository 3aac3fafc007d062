// Round trips of the user data store through the real service, and the file write they are
// measured against.
//
//   AddRoundTrip/N     "add" of an entry already in an N-entry recents list (it moves to the
//                      front, so the list keeps its length and every add walks the whole list),
//                      then a small "read" as the fence that shows the add has been applied
//   FenceRoundTrip     that fence alone (an empty favourites list), to subtract
//   ReadRoundTrip/N    "read" of the N-entry recents list
//   FsyncedWrite/N     the same domain's bytes written to a temporary file, fsync'd, renamed
//   FirstReadAfterRestart/N  the first "read" of the N-entry list by a freshly started service
//                      (it loads the whole file), the restart itself not timed
//   LumerisRecents/N   the `lumeris recents` program end to end (start, read, print)
//
// Each benchmark reports p50_us and p90_us over its iterations. The service runs in a scratch
// HOME/XDG environment; run inside scripts/test-env.sh so that its notifications have a bus.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "client/service_client.h"
#include "platform/property_list_io.h"
#include "service/socket_path.h"
#include "bench_service.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

using Clock = std::chrono::steady_clock;

MessageValue Request(std::string command, std::vector<std::pair<std::string, MessageValue>> more) {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String(std::move(command)));
  for (auto& [key, value] : more) request.Set(key, std::move(value));
  return request;
}

// N distinct current-form entity IDs (CJK ideographs and beyond, as the panel records plain
// characters).
std::vector<std::string> EntityIDs(int count) {
  std::vector<std::string> ids;
  for (int n = 0; n < count; ++n) {
    const UChar32 code = 0x4E00 + n;
    icu::UnicodeString character(code >= 0xD800 ? code + 0x800 : code);  // no surrogates
    ids.push_back("com.vantorel.lmk:{\"char\":\"" + EncodeUtf8Lenient(character) + "\"}");
  }
  return ids;
}

std::string Identifier(int count) { return "bench." + std::to_string(count); }

// Stores `ids` as the recents list of Identifier(ids.size()) and waits until it is applied.
void StoreRecents(ServiceClient& client, const std::vector<std::string>& ids) {
  MessageValue array = MessageValue::MakeArray();
  for (const std::string& id : ids) array.Append(MessageValue::String(id));
  client.Send(Request("set", {{"target", MessageValue::String("recents")},
                              {"array", std::move(array)},
                              {"identifier", MessageValue::String(Identifier(static_cast<int>(ids.size())))}}));
}

bool Fence(ServiceClient& client) {
  return client
      .Request(Request("read", {{"target", MessageValue::String("favorites")},
                                {"identifier", MessageValue::String("bench.fence")}}),
               std::chrono::seconds(30))
      .has_value();
}

void BM_AddRoundTrip(benchmark::State& state) {
  ServiceClient* client = BenchService::Get().client();
  if (client == nullptr) return state.SkipWithError("no service");
  const int count = static_cast<int>(state.range(0));
  const std::vector<std::string> ids = EntityIDs(count);
  StoreRecents(*client, ids);
  Fence(*client);
  // The list rotates: the entry added is always the current last one.
  int next = count - 1;
  TimeIterations(state, [&] {
    client->Send(Request("add", {{"target", MessageValue::String("recents")},
                                 {"item", MessageValue::String(ids[static_cast<std::size_t>(next)])},
                                 {"identifier", MessageValue::String(Identifier(count))}}));
    next = next == 0 ? count - 1 : next - 1;
    return Fence(*client);
  });
}
BENCHMARK(BM_AddRoundTrip)->Arg(10)->Arg(1000)->Arg(10000)->Arg(100000)->UseManualTime()->Unit(benchmark::kMicrosecond);

void BM_FenceRoundTrip(benchmark::State& state) {
  ServiceClient* client = BenchService::Get().client();
  if (client == nullptr) return state.SkipWithError("no service");
  TimeIterations(state, [&] { return Fence(*client); });
}
BENCHMARK(BM_FenceRoundTrip)->UseManualTime()->Unit(benchmark::kMicrosecond);

void BM_ReadRoundTrip(benchmark::State& state) {
  ServiceClient* client = BenchService::Get().client();
  if (client == nullptr) return state.SkipWithError("no service");
  const int count = static_cast<int>(state.range(0));
  StoreRecents(*client, EntityIDs(count));
  Fence(*client);
  const MessageValue read = Request("read", {{"target", MessageValue::String("recents")},
                                             {"identifier", MessageValue::String(Identifier(count))}});
  TimeIterations(state, [&] {
    std::optional<MessageValue> reply = client->Request(read, std::chrono::seconds(30));
    return reply && reply->Find("array") && reply->Find("array")->is_array();
  });
}
BENCHMARK(BM_ReadRoundTrip)->Arg(10)->Arg(1000)->Arg(10000)->Arg(100000)->UseManualTime()->Unit(benchmark::kMicrosecond);

void BM_FirstReadAfterRestart(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  if (BenchService::Get().client() == nullptr) return state.SkipWithError("no service");
  StoreRecents(*BenchService::Get().client(), EntityIDs(count));
  Fence(*BenchService::Get().client());
  const MessageValue read = Request("read", {{"target", MessageValue::String("recents")},
                                             {"identifier", MessageValue::String(Identifier(count))}});
  std::vector<double> micros;
  for (auto _ : state) {
    if (!BenchService::Get().Restart()) return state.SkipWithError("the service did not restart");
    const auto start = Clock::now();
    std::optional<MessageValue> reply = BenchService::Get().client()->Request(read, std::chrono::seconds(60));
    const std::chrono::duration<double> elapsed = Clock::now() - start;
    if (!reply || !reply->Find("array") || !reply->Find("array")->is_array()) {
      return state.SkipWithError("no list in the reply");
    }
    state.SetIterationTime(elapsed.count());
    micros.push_back(elapsed.count() * 1e6);
  }
  std::sort(micros.begin(), micros.end());
  if (!micros.empty()) state.counters["p50_us"] = micros[micros.size() / 2];
}
BENCHMARK(BM_FirstReadAfterRestart)->Arg(100000)->Iterations(5)->UseManualTime()->Unit(benchmark::kMillisecond);

void BM_LumerisRecents(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  if (BenchService::Get().client() == nullptr) return state.SkipWithError("no service");
  StoreRecents(*BenchService::Get().client(), EntityIDs(count));
  Fence(*BenchService::Get().client());
  std::string program = LUMERIS_BENCH_CLI, sub = "recents", option = "--identifier", id = Identifier(count);
  char* argv[] = {program.data(), sub.data(), option.data(), id.data(), nullptr};
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
  TimeIterations(state, [&] {
    pid_t pid = -1;
    if (posix_spawn(&pid, program.c_str(), &actions, nullptr, argv, environ) != 0) return false;
    int status = 0;
    waitpid(pid, &status, 0);
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
  });
  posix_spawn_file_actions_destroy(&actions);
}
BENCHMARK(BM_LumerisRecents)->Arg(100000)->Iterations(5)->UseManualTime()->Unit(benchmark::kMillisecond);

void BM_FsyncedWrite(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  plist::Array list;
  for (const std::string& id : EntityIDs(count)) list.emplace_back(id);
  const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(
      plist::Value(plist::Dictionary{{"version", 1}, {"Recents:" + Identifier(count), std::move(list)}}));
  const std::filesystem::path target = BenchService::Get().root() / "fsynced-write.plist";
  const std::string temporary = target.string() + ".tmp";
  TimeIterations(state, [&] {
    const int fd = open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    if (fd < 0) return false;
    const bool written = write(fd, bytes.data(), bytes.size()) == static_cast<ssize_t>(bytes.size());
    const bool synced = fsync(fd) == 0;
    close(fd);
    return written && synced && rename(temporary.c_str(), target.c_str()) == 0;
  });
  state.counters["bytes"] = static_cast<double>(bytes.size());
}
BENCHMARK(BM_FsyncedWrite)->Arg(10)->Arg(1000)->Arg(10000)->UseManualTime()->Unit(benchmark::kMicrosecond);

}  // namespace
}  // namespace lumeris

BENCHMARK_MAIN();
