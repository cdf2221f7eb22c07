// Client side of the target server's benchmarks (scripts/net_bench.py starts the server).
//
//   zin_net_bench latency PORT CALLS   p50 and p99 of a ping and of four library calls on the
//                                      demo design's small core, interleaved
//   zin_net_bench load PORT BIT SECONDS START_MS
//                                      from START_MS (ms since the epoch), write-and-read pairs
//                                      on output bit BIT of core 0:1:0 for SECONDS, each read
//                                      checked against the write before it; prints
//                                      "CALLS MISMATCHES"
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "ZinMOX/ZinMOX.h"
#include "ZinNet/TcpTransport.h"
#include "ZinRT/ZinJtag.h"

namespace {

using Clock = std::chrono::steady_clock;
using ZinRT::ZinMOX_ValueMap;

struct Session {
  explicit Session(uint16_t port)
      : transport(std::make_shared<ZinNet::TcpTransport>("127.0.0.1", port)),
        handle(ZinJtag_openSession(transport)) {}
  ~Session() { ZinJtag_closeSession(handle); }
  std::shared_ptr<ZinNet::TcpTransport> transport;
  uint32_t handle;
};

void check(uint32_t status, const char* what) {
  if (status != ZINMOX_SUCCESS) {
    std::fprintf(stderr, "zin_net_bench: %s failed\n", what);
    std::exit(1);
  }
}

uint32_t writeBit(uint32_t handle, ZIN_CORE_REF* ref, const char* value) {
  ZinMOX_ValueMap values{{"mine", value}};
  uintptr_t word = reinterpret_cast<uintptr_t>(&values);
  return ZinMOX_writeValues(handle, ref, &word);
}

std::string readBit(uint32_t handle, ZIN_CORE_REF* ref) {
  ZinMOX_ValueMap values;
  uintptr_t word = reinterpret_cast<uintptr_t>(&values);
  check(ZinMOX_readValues(handle, ref, &word), "a named read");
  return values["mine"];
}

void defineBit(uint32_t handle, ZIN_CORE_REF* ref, uint32_t bit) {
  check(ZinMOX_initCore(handle, ref), "initCore");
  check(ZinMOX_defineSignal(handle, ref, "mine", ZINMOX_ASYNC_OUTPUT, bit), "defineSignal");
  check(ZinMOX_defineSignal(handle, ref, "mine", ZINMOX_ASYNC_INPUT, bit), "defineSignal");
}

double percentile(std::vector<double> values, double p) {
  std::sort(values.begin(), values.end());
  return values[static_cast<size_t>(p * static_cast<double>(values.size() - 1))];
}

int latency(uint16_t port, int calls) {
  Session s(port);
  ZIN_CORE_REF ref{0, 1, 2};  // the demo's early-layout core: 4, 2, 4, 2 bits
  defineBit(s.handle, &ref, 0);
  uint8_t out = 0;
  uint8_t mask = 0x0F;
  uint8_t in = 0;
  struct Case {
    const char* name;
    std::function<void(int)> call;
    std::vector<double> us;
  };
  std::vector<Case> cases;
  // A version 1 server has no ping: its cheapest request, a core list, stands in.
  std::vector<ZIN_CORE_REF> refs;
  s.transport->connect();
  if (s.transport->protocolVersion() >= 2) {
    cases.push_back({"ping", [&](int) { s.transport->ping(); }, {}});
  } else {
    cases.push_back({"core list", [&](int) { s.transport->listCores(refs); }, {}});
  }
  cases.push_back({"named write",
                   [&](int i) { check(writeBit(s.handle, &ref, i % 2 ? "1" : "0"), "write"); },
                   {}});
  cases.push_back({"named read", [&](int) { readBit(s.handle, &ref); }, {}});
  cases.push_back({"setPortBits",
                   [&](int i) {
                     out = static_cast<uint8_t>(i & 0x0F);
                     check(ZinMOX_setPortBits(s.handle, &ref, &out, &mask, 4, nullptr, nullptr, 0),
                           "setPortBits");
                   },
                   {}});
  cases.push_back({"getPortBits",
                   [&](int) {
                     check(ZinMOX_getPortBits(s.handle, &ref, &in, nullptr, nullptr, 4, nullptr,
                                              nullptr, nullptr, nullptr, nullptr, 0),
                           "getPortBits");
                   },
                   {}});
  const int warmup = std::max(calls / 10, 10);
  for (int i = -warmup; i < calls; ++i) {
    for (Case& c : cases) {
      const auto start = Clock::now();
      c.call(i);
      const std::chrono::duration<double, std::micro> took = Clock::now() - start;
      if (i >= 0) c.us.push_back(took.count());
    }
  }
  const double ping = percentile(cases[0].us, 0.5);
  std::printf("%-12s %9s %9s %8s\n", "call", "p50 us", "p99 us", "p50/ping");
  for (const Case& c : cases) {
    const double p50 = percentile(c.us, 0.5);
    std::printf("%-12s %9.1f %9.1f %8.2f\n", c.name, p50, percentile(c.us, 0.99), p50 / ping);
  }
  return 0;
}

int load(uint16_t port, uint32_t bit, double seconds, long long startMs) {
  Session s(port);
  ZIN_CORE_REF ref{0, 1, 0};
  defineBit(s.handle, &ref, bit);
  uint64_t calls = 0;
  uint64_t mismatches = 0;
  // All clients start at the same wall-clock time, so that each one's calls count against the
  // same period of load.
  const std::chrono::system_clock::time_point start{std::chrono::milliseconds(startMs)};
  std::this_thread::sleep_until(start);
  const auto end = Clock::now() + std::chrono::duration<double>(seconds);
  for (uint64_t i = bit; Clock::now() < end; ++i) {
    const char* value = i % 2 ? "1" : "0";
    check(writeBit(s.handle, &ref, value), "a named write");
    if (readBit(s.handle, &ref) != value) ++mismatches;
    calls += 2;
  }
  std::printf("%llu %llu\n", static_cast<unsigned long long>(calls),
              static_cast<unsigned long long>(mismatches));
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  const std::string mode = argc > 1 ? argv[1] : "";
  if (mode == "latency" && argc == 4) return latency(std::atoi(argv[2]), std::atoi(argv[3]));
  if (mode == "load" && argc == 6) {
    return load(std::atoi(argv[2]), std::atoi(argv[3]), std::atof(argv[4]), std::atoll(argv[5]));
  }
  std::fprintf(stderr,
               "usage: zin_net_bench latency PORT CALLS\n"
               "       zin_net_bench load PORT BIT SECONDS START_MS\n"
               "Run through scripts/net_bench.py, which starts the server.\n");
  return 2;
}
