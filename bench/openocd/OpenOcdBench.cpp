// Calls per second through OpenOCD and the RTL model, beside the same scans sent as raw Tcl
// requests, and the bits the hub protocol shifts per call against the benchmarks' wire-time
// formula. Run by scripts/openocd-bench.sh (which starts zinmox-rtlsim and OpenOCD); not a test.
//
//   zin_openocd_bench PORT [SECONDS]
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include "ZinHub/HubCodec.h"
#include "ZinHub/HubTransport.h"
#include "ZinHub/OpenOcdEngine.h"
#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"

namespace {

using Clock = std::chrono::steady_clock;

// Calls per second of `call` over about `seconds`.
double rate(double seconds, const std::function<void()>& call) {
  call();  // warm up
  const auto start = Clock::now();
  long count = 0;
  while (std::chrono::duration<double>(Clock::now() - start).count() < seconds) {
    call();
    ++count;
  }
  return count / std::chrono::duration<double>(Clock::now() - start).count();
}

struct Width {
  uint32_t ao, so, ai, si;
};

// TCK cycles of one whole-port write and read by the hub protocol (DR scans n + 5, one IR scan
// of a 4-bit IR per call) and by the wire-time formula of bench/BenchSession.h.
void overhead(const char* name, Width w) {
  const size_t l = 2 * w.ao + 17 * w.so + 1;
  const size_t n = 4 * w.ai + 6 * w.si;
  const double ir = 4 + 6;
  const double write =
      ir + ZinHub::stageRequest(0, ZinHub::BitVector(l, 0)).size() + 5 +
      ZinHub::replyRequest(ZinHub::HubOp::kCommit, 0, ZinHub::kDefaultWaitBits, 8).size() + 5;
  const double read =
      ir +
      ZinHub::replyRequest(ZinHub::HubOp::kCapture, 0, ZinHub::kDefaultWaitBits, n + 16).size() +
      5 + ZinHub::replyRequest(ZinHub::HubOp::kClear, 0, ZinHub::kDefaultWaitBits, 8).size() + 5;
  const double writeFormula = 2.0 * w.ao + 17.0 * w.so + 1 + 4;
  const double readFormula = 4.0 * w.ai + 6.0 * w.si + 16 + 4;
  std::printf("%-22s write %8.0f TCK vs %8.0f (%5.1f %%)   read %8.0f TCK vs %8.0f (%5.1f %%)\n",
              name, write, writeFormula, 100 * (write / writeFormula - 1), read, readFormula,
              100 * (read / readFormula - 1));
}

struct Core {
  const char* name;
  ZIN_CORE_REF ref;
  Width w;
};

void measure(uint32_t handle, ZinHub::OpenOcdEngine& raw, const Core& core, double seconds) {
  ZIN_CORE_REF ref = core.ref;
  ZinMOX_initCore(handle, &ref);
  std::vector<uint8_t> async((core.w.ao + 7) / 8, 0x5A), mask(async.size(), 0xFF);
  std::vector<uint8_t> sync(16 * ((core.w.so + 7) / 8), 0x33), smask((core.w.so + 7) / 8, 0xFF);
  std::vector<uint8_t> in(4 * 64);
  const auto write = [&] {
    if (ZinMOX_setPortBits(handle, &ref, async.data(), mask.data(), core.w.ao, sync.data(),
                           smask.data(), core.w.so) != 0) {
      std::fprintf(stderr, "write failed\n");
      std::exit(1);
    }
  };
  const auto read = [&] {
    if (ZinMOX_getPortBits(handle, &ref, &in[0], &in[32], &in[64], core.w.ai, &in[96], &in[128],
                           &in[160], &in[192], &in[224], core.w.si) != 0) {
      std::fprintf(stderr, "read failed\n");
      std::exit(1);
    }
  };
  // The raw scripts: the very scans of one call, as the library's last request sent them.
  write();
  const std::string writeScript = raw.lastScript();
  read();
  const std::string readScript = raw.lastScript();
  // Library and raw take turns in short rounds; the best round of each counts, so that the load
  // of a shared machine does not favour one side.
  double writeRate = 0, readRate = 0, rawWrite = 0, rawRead = 0;
  for (int round = 0; round < 5; ++round) {
    writeRate = std::max(writeRate, rate(seconds / 5, write));
    rawWrite = std::max(rawWrite, rate(seconds / 5, [&] { raw.tcl(writeScript); }));
    readRate = std::max(readRate, rate(seconds / 5, read));
    rawRead = std::max(rawRead, rate(seconds / 5, [&] { raw.tcl(readScript); }));
  }
  std::printf("%-24s write %7.0f/s raw %7.0f/s (%.2fx)   read %7.0f/s raw %7.0f/s (%.2fx)\n",
              core.name, writeRate, rawWrite, rawWrite / writeRate, readRate, rawRead,
              rawRead / readRate);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc < 2) {
    std::fprintf(stderr, "usage: zin_openocd_bench TCL_PORT [SECONDS]\n");
    return 2;
  }
  const auto port = static_cast<uint16_t>(std::atoi(argv[1]));
  const double seconds = argc > 2 ? std::atof(argv[2]) : 2.0;
  std::printf(
      "Protocol overhead: TCK per whole-port call (hub protocol, W = 64, one IR scan) "
      "against the wire-time formula\n");
  overhead("8 bits per port", {8, 8, 8, 8});
  overhead("64 bits per port", {64, 64, 64, 64});
  overhead("1024 bits per port", {1024, 1024, 1024, 1024});
  overhead("4096 bits per port", {4096, 4096, 4096, 4096});

  auto engine = std::make_shared<ZinHub::OpenOcdEngine>("127.0.0.1", port, ZinHub::rtlModelBoard());
  engine->connect();
  const uint32_t handle =
      ZinJtag_openSession(std::make_shared<ZinHub::HubTransport>(engine, ZinHub::rtlModelBoard()));
  ZinHub::OpenOcdEngine raw("127.0.0.1", port, ZinHub::rtlModelBoard());
  raw.connect();
  std::printf(
      "\nCalls per second through OpenOCD and zinmox-rtlsim (whole-port write = stage + "
      "commit, read = capture + clear),\nbeside the same scans as one raw Tcl request "
      "(raw/library: the cost of a library call relative to its raw scans)\n");
  measure(handle, *engine, {"small core 0:1:2 (4/2/4/2)", {0, 1, 2}, {4, 2, 4, 2}}, seconds);
  measure(handle, *engine, {"wide core 0:1:0 (16/8/16/12)", {0, 1, 0}, {16, 8, 16, 12}}, seconds);
  ZinJtag_closeSession(handle);
  return 0;
}
