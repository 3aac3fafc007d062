// database_bench: the three character requests of the real lumeris-fileservice on the bundle the
// build wrote, end to end over the socket, with the reference rules and with the indexed rules
// (LUMERIS_DATABASE_RULES), side by side with their ratio.
//
// Measures: the first search after the service starts; searches of the 3-or-more-letter words of
// bench/data/search_words.txt (a seeded sample of CLDR's English annotation keywords) and of one
// and two letters, limit 100; "a" with limit 2^63; related characters and information records;
// searches from 8 connections at once (the words once more); the service's resident memory after
// 10,000 mixed requests and after 10,000 more. Each service runs in a private temporary HOME and
// XDG_RUNTIME_DIR and is stopped at the end. `database_bench indexed` skips the reference run.
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "client/service_client.h"
#include "service/socket_path.h"
#include "stop_service.h"

namespace lumeris {
namespace {

using Clock = std::chrono::steady_clock;
using namespace std::chrono_literals;

constexpr std::uint64_t kNoLimit = std::uint64_t{1} << 63;

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

double Percentile(std::vector<double> samples, int percent) {
  std::sort(samples.begin(), samples.end());
  return samples[std::min(samples.size() - 1,
                          samples.size() * static_cast<std::size_t>(percent) / 100)];
}

// The service's pid, from the peer credentials of a connection to its socket.
pid_t ServicePid() {
  int fd = socket(AF_UNIX, SOCK_STREAM, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::snprintf(address.sun_path, sizeof address.sun_path, "%s", ServiceSocketPath()->c_str());
  ucred peer{};
  socklen_t size = sizeof peer;
  pid_t pid = 0;
  if (connect(fd, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0 &&
      getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) == 0)
    pid = peer.pid;
  close(fd);
  return pid;
}

double ResidentMegabytes(pid_t pid) {
  std::ifstream status("/proc/" + std::to_string(pid) + "/status");
  for (std::string line; std::getline(status, line);) {
    if (line.rfind("VmRSS:", 0) == 0) return std::stod(line.substr(6)) / 1024.0;
  }
  return 0;
}

struct Figures {
  double first = 0, words_p50 = 0, words_p99 = 0, again_p50 = 0, again_p99 = 0, short_p50 = 0,
         a_unlimited = 0;
  double related_p50 = 0, info_p50 = 0, parallel_per_second = 0, rss_after = 0, rss_later = 0;
};

Figures Measure(const char* rules, const std::vector<std::string>& words, bool full) {
  char home[] = "/tmp/lumeris-database-bench-XXXXXX";
  if (mkdtemp(home) == nullptr) std::exit(1);
  const std::filesystem::path root = home;
  std::filesystem::create_directories(root / "runtime");
  std::filesystem::permissions(root / "runtime", std::filesystem::perms::owner_all);
  setenv("HOME", home, 1);
  setenv("XDG_CONFIG_HOME", (root / "config").c_str(), 1);
  setenv("XDG_CONFIG_DIRS", (root / "config-dirs").c_str(), 1);
  setenv("XDG_RUNTIME_DIR", (root / "runtime").c_str(), 1);
  setenv("LUMERIS_DATABASE_RULES", rules, 1);

  Figures figures;
  std::string error;
  std::unique_ptr<ServiceClient> client = ServiceClient::Connect({}, &error);
  if (!client) {
    std::printf("cannot start: %s\n", error.c_str());
    std::exit(1);
  }
  figures.first = Time(*client, {Request("search_matched_chars", "heart", 100)})[0];

  std::vector<MessageValue> searches;
  for (const std::string& word : words)
    searches.push_back(Request("search_matched_chars", word, 100));
  std::vector<double> samples = Time(*client, searches);
  figures.words_p50 = Percentile(samples, 50);
  figures.words_p99 = Percentile(samples, 99);
  // The same words again: the service has had the time to complete its index meanwhile.
  samples = Time(*client, searches);
  figures.again_p50 = Percentile(samples, 50);
  figures.again_p99 = Percentile(samples, 99);

  std::vector<MessageValue> short_searches;
  for (const char* text : {"a", "e", "x", "q", "7", "he", "ca", "zz", "on", "qx", "st", "9"})
    short_searches.push_back(Request("search_matched_chars", text, 100));
  figures.short_p50 = Percentile(Time(*client, short_searches), 50);
  figures.a_unlimited = Percentile(
      Time(*client, std::vector<MessageValue>(3, Request("search_matched_chars", "a", kNoLimit))),
      50);

  std::vector<MessageValue> related;
  std::vector<MessageValue> info;
  for (const char* character : {"a", "e", "中", "👍", "0", "z", "国", "A"}) {
    for (int i = 0; i < 25; ++i) {
      related.push_back(Request("search_related_chars", character, 100));
      info.push_back(Request("search_character_info", character, 0));
    }
  }
  figures.related_p50 = Percentile(Time(*client, related), 50);
  figures.info_p50 = Percentile(Time(*client, info), 50);

  // 8 connections, each searching the words in turn for two seconds.
  std::atomic<long> done{0};
  std::vector<std::thread> threads;
  const Clock::time_point start = Clock::now();
  for (int t = 0; t < 8; ++t) {
    threads.emplace_back([&, t] {
      std::unique_ptr<ServiceClient> own = ServiceClient::Connect({}, nullptr);
      for (std::size_t i = static_cast<std::size_t>(t) * 25; own && Clock::now() - start < 2s;
           ++i) {
        if (!own->Request(searches[i % searches.size()], 120s)) return;
        ++done;
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  figures.parallel_per_second =
      static_cast<double>(done) / std::chrono::duration<double>(Clock::now() - start).count();

  if (full) {
    // Mixed requests: words, their first one or two letters, related characters, records.
    std::mt19937 random(7);
    std::vector<MessageValue> mixed;
    for (int i = 0; i < 10000; ++i) {
      const std::string& word = words[random() % words.size()];
      switch (random() % 4) {
        case 0:
          mixed.push_back(Request("search_matched_chars", word, 100));
          break;
        case 1:
          mixed.push_back(Request("search_matched_chars", word.substr(0, 1 + random() % 2), 100));
          break;
        case 2:
          mixed.push_back(Request("search_related_chars", word.substr(0, 1), 100));
          break;
        default:
          mixed.push_back(Request("search_character_info", word.substr(0, 1), 0));
          break;
      }
    }
    const pid_t pid = ServicePid();
    Time(*client, mixed);
    figures.rss_after = ResidentMegabytes(pid);
    Time(*client, mixed);
    figures.rss_later = ResidentMegabytes(pid);
  }

  client.reset();
  StopService();
  std::filesystem::remove_all(root);
  return figures;
}

int Main(int argc, char** argv) {
  setenv("LUMERIS_SYSTEM_ROOT", LUMERIS_BENCH_SYSTEM_ROOT, 0);
  setenv("LUMERIS_FONTCONFIG_FILE", LUMERIS_BENCH_FONTCONFIG_FILE, 0);
  if (getenv("LUMERIS_FILESERVICE") == nullptr)
    setenv("LUMERIS_FILESERVICE", LUMERIS_BENCH_FILESERVICE, 1);
  std::vector<std::string> words;
  std::ifstream list(LUMERIS_BENCH_WORDS);
  for (std::string word; std::getline(list, word);) {
    if (word.size() >= 3) words.push_back(word);
  }
  const bool indexed_only = argc > 1 && std::string(argv[1]) == "indexed";
  const Figures indexed = Measure("indexed", words, true);
  const Figures reference = indexed_only ? Figures{} : Measure("reference", words, false);

  std::printf("%-52s %12s %12s %8s\n", "", "reference", "indexed", "ratio");
  // The ratio says how many times better the indexed rules do: reference / indexed for times,
  // indexed / reference for the throughput.
  auto row = [&](const char* what, double Figures::*field, bool higher_is_better = false) {
    const double a = reference.*field;
    const double b = indexed.*field;
    const double ratio = higher_is_better ? (a > 0 ? b / a : 0.0) : (b > 0 ? a / b : 0.0);
    std::printf("%-52s %12.3f %12.3f %8.1f\n", what, a, b, ratio);
  };

  row("first search after start, ms (goal <= 50)", &Figures::first);
  std::printf("search, %zu words of 3+ letters, limit 100:\n", words.size());
  row("  p50 ms (goal <= 0.5)", &Figures::words_p50);
  row("  p99 ms (goal <= 5)", &Figures::words_p99);
  std::printf("the same words again:\n");
  row("  p50 ms", &Figures::again_p50);
  row("  p99 ms", &Figures::again_p99);
  row("search, 1-2 letters, limit 100, p50 ms (goal <= 5)", &Figures::short_p50);
  row("search \"a\", limit 2^63, ms (goal <= 30)", &Figures::a_unlimited);
  row("related characters, limit 100, p50 ms (goal <= 0.3)", &Figures::related_p50);
  row("information record, p50 ms (goal <= 0.3)", &Figures::info_p50);
  row("8 connections, searches/s (goal >= 3000)", &Figures::parallel_per_second, true);
  std::printf(
      "resident memory after 10,000 mixed requests: %.1f MB, after 10,000 more: %.1f MB "
      "(goal <= 40, within 5%%)\n",
      indexed.rss_after, indexed.rss_later);
  return 0;
}

}  // namespace
}  // namespace lumeris

int main(int argc, char** argv) { return lumeris::Main(argc, argv); }
