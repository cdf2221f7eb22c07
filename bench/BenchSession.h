// One JTAG session on a NullTransport with one initialised MOX core, for the benchmarks.
#ifndef ZIN_BENCH_BENCHSESSION_H
#define ZIN_BENCH_BENCHSESSION_H

#include <benchmark/benchmark.h>

#include <cstdint>

#include "ZinMOX/ZinMOX.h"

namespace ZinBench {

/// Opens a session whose core has `width` bits on each of its four ports and initialises it;
/// closes the session on destruction. Failures abort the benchmark with the session's message.
class BenchSession {
 public:
  BenchSession(benchmark::State& state, uint32_t width);
  ~BenchSession();
  BenchSession(const BenchSession&) = delete;
  BenchSession& operator=(const BenchSession&) = delete;

  uint32_t handle() const { return handle_; }
  ZIN_CORE_REF* ref() { return &ref_; }
  /// Skips the benchmark with the last session message unless `result` is 0.
  bool check(uint32_t result, const char* what);

 private:
  benchmark::State& state_;
  uint32_t handle_ = 0;
  ZIN_CORE_REF ref_{1, 2, 0};
};

/// Bits on the wire of one whole-port write of a core with `width` bits per port: the write line
/// (both output values, 16 steps and an update bit per synchronous output bit, both update masks,
/// plus one) and the four-bit line of code 02.
inline double writeWireBits(uint32_t asyncOut, uint32_t syncOut) {
  return 2.0 * asyncOut + 17.0 * syncOut + 1 + 4;
}
/// Bits on the wire of one whole-port read: the read line (four bits per asynchronous and six
/// per synchronous input bit, plus 16) and the four-bit line of code 04.
inline double readWireBits(uint32_t asyncIn, uint32_t syncIn) {
  return 4.0 * asyncIn + 6.0 * syncIn + 16 + 4;
}
/// Records the bits a call moves, read by scripts/bench.py.
inline void setWireBits(benchmark::State& state, double bits) {
  state.counters["wire_bits"] = bits;
}

}  // namespace ZinBench

#endif
