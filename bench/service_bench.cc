// service_bench: the real lumeris-fileservice, measured through the client library.
//
// Reports the round-trip latency (p50, p99) of a small request on one connection, the aggregate
// messages per second with 1, 8 and 64 concurrent connections, and the time from nothing running
// to the first reply through on-demand start. Runs in a private temporary XDG_RUNTIME_DIR and
// stops every service it started.
#include <signal.h>
#include <stdlib.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <filesystem>
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

MessageValue SmallRequest() {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String("search_bench"));
  request.Set("transactionID", MessageValue::Uint64(1));
  return request;
}

double Microseconds(Clock::duration d) {
  return std::chrono::duration<double, std::micro>(d).count();
}

void OnDemandStart(int rounds) {
  std::vector<double> times;
  for (int i = 0; i < rounds; ++i) {
    const Clock::time_point start = Clock::now();
    std::string error;
    std::unique_ptr<ServiceClient> client = ServiceClient::Connect({}, &error);
    std::optional<MessageValue> reply = client ? client->Request(SmallRequest(), 5s) : std::nullopt;
    const Clock::time_point end = Clock::now();
    if (!reply) {
      std::printf("on-demand start failed: %s\n", error.c_str());
      return;
    }
    times.push_back(Microseconds(end - start) / 1000.0);
    client.reset();
    StopService();
  }
  std::sort(times.begin(), times.end());
  std::printf("on-demand start to first reply: median %.1f ms, worst %.1f ms (%d rounds; goal <= 150 ms)\n",
              times[times.size() / 2], times.back(), rounds);
}

void Latency(ServiceClient& client, int requests) {
  const MessageValue request = SmallRequest();
  for (int i = 0; i < 1000; ++i) client.Request(request, 5s);  // warm up
  std::vector<double> samples;
  samples.reserve(requests);
  for (int i = 0; i < requests; ++i) {
    const Clock::time_point start = Clock::now();
    if (!client.Request(request, 5s)) {
      std::printf("latency: request failed\n");
      return;
    }
    samples.push_back(Microseconds(Clock::now() - start));
  }
  std::sort(samples.begin(), samples.end());
  std::printf("round trip, one connection: p50 %.1f us, p99 %.1f us (%d requests; goal p50 <= 50 us)\n",
              samples[samples.size() / 2], samples[samples.size() * 99 / 100], requests);
}

// Each connection keeps `window` requests in flight for `duration`; returns replies per second.
double Throughput(int connections, int window, std::chrono::milliseconds duration) {
  std::vector<std::unique_ptr<ServiceClient>> clients;
  for (int i = 0; i < connections; ++i) clients.push_back(ServiceClient::Connect());
  std::atomic<bool> stop{false};
  std::atomic<long> replies{0};
  std::vector<std::thread> threads;
  const MessageValue request = SmallRequest();
  for (auto& client : clients) {
    threads.emplace_back([&, c = client.get()] {
      std::vector<std::uint64_t> in_flight;
      long mine = 0;
      while (!stop) {
        while (static_cast<int>(in_flight.size()) < window) {
          std::optional<std::uint64_t> id = c->SendWantingReply(request);
          if (!id) return;
          in_flight.push_back(*id);
        }
        if (!c->WaitForReply(in_flight.front(), 5s)) return;
        in_flight.erase(in_flight.begin());
        ++mine;
      }
      for (std::uint64_t id : in_flight) c->WaitForReply(id, 5s);
      replies += mine;
    });
  }
  const Clock::time_point start = Clock::now();
  std::this_thread::sleep_for(duration);
  stop = true;
  const Clock::time_point end = Clock::now();
  for (std::thread& thread : threads) thread.join();
  return static_cast<double>(replies.load()) / std::chrono::duration<double>(end - start).count();
}

int Main() {
  char runtime[] = "/tmp/lumeris-bench-XXXXXX";
  if (mkdtemp(runtime) == nullptr) return 1;
  setenv("XDG_RUNTIME_DIR", runtime, 1);
  if (getenv("LUMERIS_FILESERVICE") == nullptr) setenv("LUMERIS_FILESERVICE", LUMERIS_BENCH_FILESERVICE, 1);

  OnDemandStart(7);

  std::string error;
  std::unique_ptr<ServiceClient> client = ServiceClient::Connect({}, &error);
  if (!client) {
    std::printf("cannot connect: %s\n", error.c_str());
    return 1;
  }
  Latency(*client, 20000);
  for (int connections : {1, 8, 64}) {
    double rate = Throughput(connections, 16, 2s);
    std::printf("aggregate, %2d connections (16 in flight each): %.0f messages/s (goal >= 40000)\n",
                connections, rate);
  }
  client.reset();
  StopService();
  std::filesystem::remove_all(runtime);
  return 0;
}

}  // namespace
}  // namespace lumeris

int main() { return lumeris::Main(); }
