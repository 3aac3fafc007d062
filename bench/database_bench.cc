// database_bench: the three character requests of the real lumeris-fileservice on the bundle the
// build wrote, end to end through the client library.
//
// Reports search p50/p99 over a fixed list of 200 English keywords (bench/data/search_words.txt,
// a seeded sample of CLDR's English annotation keywords), the search of "a" and of "e" with limit
// 100, and related-characters and information-record p50. Runs the service in a private temporary
// HOME and XDG_RUNTIME_DIR and stops it at the end.
#include <signal.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "client/service_client.h"
#include "service/socket_path.h"

namespace lumeris {
namespace {

using Clock = std::chrono::steady_clock;
using namespace std::chrono_literals;

MessageValue Request(const char* command, const std::string& text, std::uint64_t limit) {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String(command));
  request.Set("string", MessageValue::String(text));
  request.Set("limit", MessageValue::Uint64(limit));
  request.Set("transactionID", MessageValue::Uint64(1));
  return request;
}

// Milliseconds of each request, in the order given; a failed request stops the program.
std::vector<double> Time(ServiceClient& client, const std::vector<MessageValue>& requests) {
  std::vector<double> samples;
  for (const MessageValue& request : requests) {
    const Clock::time_point start = Clock::now();
    std::optional<MessageValue> reply = client.Request(request, 120s);
    samples.push_back(std::chrono::duration<double, std::milli>(Clock::now() - start).count());
    if (!reply || reply->Find("result") == nullptr) {
      std::printf("request failed: %s\n", request.Describe().c_str());
      std::exit(1);
    }
  }
  return samples;
}

// Stops the service this program started (the client library starts it detached): the process
// on the other end of the socket, found by its peer credentials.
void StopService() {
  const std::filesystem::path path = *ServiceSocketPath();
  int fd = socket(AF_UNIX, SOCK_STREAM, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::snprintf(address.sun_path, sizeof address.sun_path, "%s", path.c_str());
  ucred peer{};
  socklen_t size = sizeof peer;
  if (connect(fd, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0 &&
      getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) == 0 && peer.pid > 0) {
    kill(peer.pid, SIGTERM);
    while (kill(peer.pid, 0) == 0) std::this_thread::sleep_for(1ms);
  }
  close(fd);
}

double Percentile(std::vector<double> samples, int percent) {
  std::sort(samples.begin(), samples.end());
  return samples[std::min(samples.size() - 1,
                          samples.size() * static_cast<std::size_t>(percent) / 100)];
}

int Main() {
  char home[] = "/tmp/lumeris-database-bench-XXXXXX";
  if (mkdtemp(home) == nullptr) return 1;
  const std::filesystem::path root = home;
  std::filesystem::create_directories(root / "runtime");
  std::filesystem::permissions(root / "runtime", std::filesystem::perms::owner_all);
  setenv("HOME", home, 1);
  setenv("XDG_CONFIG_HOME", (root / "config").c_str(), 1);
  setenv("XDG_CONFIG_DIRS", (root / "config-dirs").c_str(), 1);
  setenv("XDG_RUNTIME_DIR", (root / "runtime").c_str(), 1);
  setenv("LUMERIS_SYSTEM_ROOT", LUMERIS_BENCH_SYSTEM_ROOT, 0);
  setenv("LUMERIS_FONTCONFIG_FILE", LUMERIS_BENCH_FONTCONFIG_FILE, 0);
  if (getenv("LUMERIS_FILESERVICE") == nullptr)
    setenv("LUMERIS_FILESERVICE", LUMERIS_BENCH_FILESERVICE, 1);

  std::vector<std::string> words;
  std::ifstream list(LUMERIS_BENCH_WORDS);
  for (std::string word; std::getline(list, word);) {
    if (!word.empty()) words.push_back(word);
  }
  std::string error;
  std::unique_ptr<ServiceClient> client = ServiceClient::Connect({}, &error);
  if (!client || words.size() < 200) {
    std::printf("cannot start: %s (%zu words)\n", error.c_str(), words.size());
    return 1;
  }

  // The first request opens the database and loads the fonts; it is timed apart.
  const double first = Time(*client, {Request("search_matched_chars", "heart", 20)})[0];
  std::vector<MessageValue> searches;
  for (const std::string& word : words)
    searches.push_back(Request("search_matched_chars", word, 20));
  const std::vector<double> search = Time(*client, searches);
  std::printf("first search (opens the database): %.1f ms\n", first);
  std::printf("search, %zu keywords, limit 20: p50 %.1f ms, p99 %.1f ms\n", search.size(),
              Percentile(search, 50), Percentile(search, 99));
  for (const char* letter : {"a", "e"}) {
    const std::vector<double> samples =
        Time(*client, std::vector<MessageValue>(5, Request("search_matched_chars", letter, 100)));
    std::printf("search \"%s\", limit 100: p50 %.1f ms (5 runs)\n", letter,
                Percentile(samples, 50));
  }
  std::vector<MessageValue> related;
  std::vector<MessageValue> info;
  for (const char* character : {"a", "e", "中", "👍", "0", "z", "国", "A"}) {
    for (int i = 0; i < 25; ++i) {
      related.push_back(Request("search_related_chars", character, 100));
      info.push_back(Request("search_character_info", character, 0));
    }
  }
  std::printf("related characters, limit 100: p50 %.2f ms (%zu requests)\n",
              Percentile(Time(*client, related), 50), related.size());
  std::printf("information record: p50 %.3f ms (%zu requests)\n",
              Percentile(Time(*client, info), 50), info.size());

  client.reset();
  StopService();
  std::filesystem::remove_all(root);
  return 0;
}

}  // namespace
}  // namespace lumeris

int main() { return lumeris::Main(); }
