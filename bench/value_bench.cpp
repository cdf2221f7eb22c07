// Named writes and reads through value maps, and the fitting of value texts.
#include <benchmark/benchmark.h>

#include <cstdint>
#include <memory>
#include <string>

#include "BenchSession.h"
#include "ZinMOX/ZinMOX_ValueMap.h"
#include "values/ZinMOX_HexText.h"

namespace ZinBench {

namespace {

using ZinRT::ZinMOX_ValueMap;

constexpr uint32_t kSmallWidth = 8;
constexpr uint32_t kSmallBus[kSmallWidth] = {0, 1, 2, 3, 4, 5, 6, 7};

uintptr_t mapWord(ZinMOX_ValueMap& map) {
  return reinterpret_cast<uintptr_t>(&map);
}

// A hexadecimal text of `digits` digits in an irregular pattern.
std::string hexText(size_t digits, uint32_t seed) {
  static constexpr char kDigits[] = "0123456789ABCDEF";
  std::string text(digits, '0');
  uint32_t x = seed * 2654435761u + 1;
  for (char& c : text) {
    x = x * 1664525u + 1013904223u;
    c = kDigits[x >> 28];
  }
  return text;
}

// One value-map call per iteration; the first failure, which check() reports, ends the loop.
using ValueCall = uint32_t (*)(uint32_t, ZIN_CORE_REF*, uintptr_t*);
void timeValueCalls(benchmark::State& state, BenchSession& session, ValueCall call, uintptr_t& word,
                    const char* name) {
  for (auto _ : state) {
    if (!session.check(call(session.handle(), session.ref(), &word), name)) break;
  }
}

void BM_SmallNamedWrite(benchmark::State& state) {
  BenchSession session(state, kSmallWidth);
  if (!session.check(ZinMOX_defineBus(session.handle(), session.ref(), "ctl", ZINMOX_ASYNC_OUTPUT,
                                      kSmallBus, kSmallWidth),
                     "ZinMOX_defineBus")) {
    return;
  }
  ZinMOX_ValueMap map{{"ctl", "3F"}};
  uintptr_t word = mapWord(map);
  timeValueCalls(state, session, ZinMOX_writeValues, word, "ZinMOX_writeValues");
  setWireBits(state, writeWireBits(kSmallWidth, kSmallWidth));
}

void BM_SmallNamedRead(benchmark::State& state) {
  BenchSession session(state, kSmallWidth);
  if (!session.check(ZinMOX_defineBus(session.handle(), session.ref(), "st", ZINMOX_ASYNC_INPUT,
                                      kSmallBus, kSmallWidth),
                     "ZinMOX_defineBus")) {
    return;
  }
  ZinMOX_ValueMap map;
  uintptr_t word = mapWord(map);
  timeValueCalls(state, session, ZinMOX_readValues, word, "ZinMOX_readValues");
  setWireBits(state, readWireBits(kSmallWidth, kSmallWidth));
}

// Every output of the core through the map: the two whole-port signals, plain values.
void BM_MapWriteAllOutputs(benchmark::State& state) {
  const auto width = static_cast<uint32_t>(state.range(0));
  BenchSession session(state, width);
  const size_t digits = (width + 3) / 4;
  ZinMOX_ValueMap map{{"async_out_data", hexText(digits, 1)},
                      {"sync_out_data", hexText(digits, 2)}};
  uintptr_t word = mapWord(map);
  timeValueCalls(state, session, ZinMOX_writeValues, word, "ZinMOX_writeValues");
  setWireBits(state, writeWireBits(width, width));
}

// Every input of the core into the map: the two whole-port signals with their activity.
void BM_MapReadAllInputs(benchmark::State& state) {
  const auto width = static_cast<uint32_t>(state.range(0));
  BenchSession session(state, width);
  ZinMOX_ValueMap map;
  uintptr_t word = mapWord(map);
  timeValueCalls(state, session, ZinMOX_readValues, word, "ZinMOX_readValues");
  setWireBits(state, readWireBits(width, width));
}

// A 16-step pulse train of the whole synchronous output port through the map.
void BM_MapWritePulseTrain(benchmark::State& state) {
  const auto width = static_cast<uint32_t>(state.range(0));
  BenchSession session(state, width);
  ZinMOX_ValueMap map{{"sync_out_data.pulsetrain", hexText(32 * ((width + 7) / 8), 3)}};
  uintptr_t word = mapWord(map);
  timeValueCalls(state, session, ZinMOX_writeValues, word, "ZinMOX_writeValues");
  setWireBits(state, writeWireBits(width, width));
}

// Fitting a long pulse-train text (256 bits per byte of a `width`-bit signal) and converting the
// 16 step vectors that a write stages: the value-text part of a pulse-train write, alone.
// Related to the write of that many synchronous output bits.
void BM_FitPulseTrainText(benchmark::State& state) {
  const auto width = static_cast<uint32_t>(state.range(0));
  const uint32_t bits = 256 * ((width + 7) / 8);
  const std::string text = hexText(bits / 4 - 3, 4);     // shorter: the fill path is taken
  const size_t stepDigits = 2 * 16 * ((width + 7) / 8);  // the 16 step vectors a write stages
  ZinRT::Zin_ByteBuffer scratch;
  ZinRT::Zin_ByteBuffer bytes;
  for (auto _ : state) {
    const ZinRT::mox::FittedHex fitted =
        ZinRT::mox::fitHexString(text.c_str(), static_cast<int32_t>(bits));
    ZinRT::mox::fittedToBin(fitted, fitted.size() - stepDigits, fitted.size() - 1, scratch, bytes);
    benchmark::DoNotOptimize(bytes.uPtr());
  }
  setWireBits(state, writeWireBits(0, width));
}

}  // namespace

BENCHMARK(BM_SmallNamedWrite);
BENCHMARK(BM_SmallNamedRead);
BENCHMARK(BM_MapWriteAllOutputs)->Arg(64)->Arg(1024)->Arg(16384)->Arg(65535);
BENCHMARK(BM_MapReadAllInputs)->Arg(64)->Arg(1024)->Arg(16384)->Arg(65535);
BENCHMARK(BM_MapWritePulseTrain)->Arg(1024)->Arg(65535);
BENCHMARK(BM_FitPulseTrainText)->Arg(1024)->Arg(65535);

}  // namespace ZinBench
