// Pieces that the benchmarks of the real service share.
//
// BenchService: `lumeris-fileservice` (or $LUMERIS_FILESERVICE) in a scratch user environment
// (HOME, XDG_CONFIG_HOME and XDG_RUNTIME_DIR under a new temporary directory), started on first
// use and ended, with its directory removed, when the process exits. The environment a benchmark
// sets before the first Get() (system root, language) reaches the service.
// TimeIterations: times each iteration of a benchmark's body and reports p50_us and p90_us.
//
// Include from exactly one source file of a benchmark program that defines
// LUMERIS_BENCH_FILESERVICE and LUMERIS_BENCH_FONTCONFIG_FILE. Not thread-safe: for a benchmark's main thread.
#pragma once

#include <benchmark/benchmark.h>
#include <signal.h>
#include <spawn.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "client/service_client.h"
#include "service/socket_path.h"

extern char** environ;

namespace lumeris {

// A scratch user environment and the service program running in it, for the whole process.
class BenchService {
 public:
  static BenchService& Get() {
    static BenchService service;
    return service;
  }
  ServiceClient* client() { return client_.get(); }
  const std::filesystem::path& root() const { return root_; }

  ~BenchService() {
    Stop();
    std::filesystem::remove_all(root_);
  }

  // Ends the service and starts a new one, which has nothing loaded.
  bool Restart() {
    Stop();
    Start();
    return client_ != nullptr;
  }

 private:
  void Stop() {
    client_.reset();
    if (pid_ > 0) {
      kill(pid_, SIGTERM);
      waitpid(pid_, nullptr, 0);
    }
    pid_ = -1;
  }

  BenchService() {
    std::string pattern = (std::filesystem::temp_directory_path() / "lumeris-bench-XXXXXX").string();
    root_ = mkdtemp(pattern.data());
    for (const char* sub : {"home", "config", "runtime"}) std::filesystem::create_directories(root_ / sub);
    chmod((root_ / "runtime").c_str(), 0700);
    setenv("HOME", (root_ / "home").c_str(), 1);
    setenv("XDG_CONFIG_HOME", (root_ / "config").c_str(), 1);
    setenv("XDG_RUNTIME_DIR", (root_ / "runtime").c_str(), 1);
    // The source tree's font configuration, so the service names the colour emoji font without
    // an installed copy.
    setenv("LUMERIS_FONTCONFIG_FILE", LUMERIS_BENCH_FONTCONFIG_FILE, 0);
    Start();
  }

  void Start() {
    const char* program = getenv("LUMERIS_FILESERVICE");
    std::string path = program && *program ? program : LUMERIS_BENCH_FILESERVICE;
    char* argv[] = {path.data(), nullptr};
    if (posix_spawn(&pid_, path.c_str(), nullptr, nullptr, argv, environ) != 0) pid_ = -1;

    ServiceClientOptions options;
    options.socket_path = ServiceSocketPath();
    options.start_on_demand = false;
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(5);
    while (!client_ && std::chrono::steady_clock::now() < deadline) {
      client_ = ServiceClient::Connect(options);
      if (!client_) std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
  }

  std::filesystem::path root_;
  pid_t pid_ = -1;
  std::unique_ptr<ServiceClient> client_;
};

// Times each iteration of `body` and reports the p50 and p90 as counters.
template <typename Body>
void TimeIterations(benchmark::State& state, Body body) {
  std::vector<double> micros;
  for (auto _ : state) {
    const auto start = std::chrono::steady_clock::now();
    if (!body()) {
      state.SkipWithError("the service did not answer");
      return;
    }
    const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
    state.SetIterationTime(elapsed.count());
    micros.push_back(elapsed.count() * 1e6);
  }
  std::sort(micros.begin(), micros.end());
  if (micros.empty()) return;
  state.counters["p50_us"] = micros[micros.size() / 2];
  state.counters["p90_us"] = micros[micros.size() * 9 / 10];
}

}  // namespace lumeris
