// Whole-port writes and reads through the exported functions.
#include <benchmark/benchmark.h>

#include <cstdint>
#include <vector>

#include "BenchSession.h"

namespace ZinBench {

namespace {

// A fixed, irregular bit pattern, so that no conversion sees only zeros.
std::vector<uint8_t> pattern(size_t bytes, uint8_t seed) {
  std::vector<uint8_t> data(bytes);
  uint32_t x = 0x9E3779B9u ^ seed;
  for (uint8_t& b : data) {
    x = x * 1664525u + 1013904223u;
    b = static_cast<uint8_t>(x >> 24);
  }
  return data;
}

void BM_SetPortBits(benchmark::State& state) {
  const auto width = static_cast<uint32_t>(state.range(0));
  BenchSession session(state, width);
  const size_t bytes = (width + 7) / 8;
  const std::vector<uint8_t> asyncData = pattern(bytes, 1), asyncMask = pattern(bytes, 2);
  const std::vector<uint8_t> syncData = pattern(16 * bytes, 3), syncMask = pattern(bytes, 4);
  for (auto _ : state) {
    const uint32_t result =
        ZinMOX_setPortBits(session.handle(), session.ref(), asyncData.data(), asyncMask.data(),
                           width, syncData.data(), syncMask.data(), width);
    if (!session.check(result, "ZinMOX_setPortBits")) break;
  }
  setWireBits(state, writeWireBits(width, width));
}

void BM_GetPortBits(benchmark::State& state) {
  const auto width = static_cast<uint32_t>(state.range(0));
  BenchSession session(state, width);
  const size_t bytes = (width + 7) / 8;
  std::vector<std::vector<uint8_t>> out(8, std::vector<uint8_t>(bytes));
  for (auto _ : state) {
    const uint32_t result = ZinMOX_getPortBits(
        session.handle(), session.ref(), out[0].data(), out[1].data(), out[2].data(), width,
        out[3].data(), out[4].data(), out[5].data(), out[6].data(), out[7].data(), width);
    if (!session.check(result, "ZinMOX_getPortBits")) break;
    benchmark::DoNotOptimize(out[0].data());
  }
  setWireBits(state, readWireBits(width, width));
}

}  // namespace

BENCHMARK(BM_SetPortBits)->Arg(64)->Arg(1024)->Arg(16384)->Arg(65535);
BENCHMARK(BM_GetPortBits)->Arg(64)->Arg(1024)->Arg(16384)->Arg(65535);

}  // namespace ZinBench
