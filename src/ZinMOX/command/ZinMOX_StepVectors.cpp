// Step strings of synchronous outputs from packed step vectors: a bit-matrix transposition, eight
// byte columns (64 outputs by sixteen steps) or one at a time.
#include <algorithm>
#include <array>
#include <cstring>
#if defined(__SSE2__)
#include <emmintrin.h>
#endif

#include "format/ZinMOX_BitFormat.h"
#include "framework/ZinMOX_Framework.h"
#include "internal/ZinMOX_Command.h"

namespace ZinRT {

namespace {

#if defined(__SSE2__)
// Byte t of `bytes` is step t's byte of a column. Shifted right by b, bit 0 of every byte is bit b
// of that byte (what a 16-bit shift brings in from the next byte lands above bit 7-b), and that
// bit alone ORed with '0' is the step character.
template <typename TrainOf>
void stageColumn(__m128i bytes, uint32_t outputs, TrainOf trainOf) {
  const __m128i lowBit = _mm_set1_epi8(1);
  const __m128i zeroChar = _mm_set1_epi8('0');
  for (uint32_t b = 0; b < outputs; ++b) {
    const __m128i chars = _mm_or_si128(_mm_and_si128(bytes, lowBit), zeroChar);
    _mm_storeu_si128(reinterpret_cast<__m128i*>(trainOf(b)), chars);
    bytes = _mm_srli_epi16(bytes, 1);
  }
}

// The registers of eight byte columns at once (64 outputs, from byte `byte` of every step
// vector): sixteen rows of eight bytes transposed by four rounds of interleaving, which leave
// row k at byte kRowOrder[k] of each column. The order reverses the four bits of k, so it is its
// own inverse: loading the rows in that order of steps puts step t at byte t.
void transposeEightColumns(const uint8_t* const* vectors, uint32_t byte, __m128i columns[8]) {
  static constexpr int kRowOrder[16] = {0, 8, 4, 12, 2, 10, 6, 14, 1, 9, 5, 13, 3, 11, 7, 15};
  const auto row = [&](int k) {
    return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(vectors[kRowOrder[k]] + byte));
  };
  __m128i pairs[8];  // 16-bit word j: column j of rows k and k+8
  for (int k = 0; k < 8; ++k) pairs[k] = _mm_unpacklo_epi8(row(k), row(k + 8));
  __m128i quads[8];  // 32-bit word j: column j (low) or 4+j (high) of rows k, k+8, k+4, k+12
  for (int k = 0; k < 4; ++k) {
    quads[k] = _mm_unpacklo_epi16(pairs[k], pairs[k + 4]);
    quads[4 + k] = _mm_unpackhi_epi16(pairs[k], pairs[k + 4]);
  }
  for (int half = 0; half < 2; ++half) {  // columns 0-3, then 4-7
    const __m128i* q = quads + 4 * half;
    const __m128i low0 = _mm_unpacklo_epi32(q[0], q[2]);  // columns 0 and 1 of rows k = 0 mod 2
    const __m128i low1 = _mm_unpacklo_epi32(q[1], q[3]);
    const __m128i high0 = _mm_unpackhi_epi32(q[0], q[2]);  // columns 2 and 3
    const __m128i high1 = _mm_unpackhi_epi32(q[1], q[3]);
    __m128i* out = columns + 4 * half;
    out[0] = _mm_unpacklo_epi64(low0, low1);
    out[1] = _mm_unpackhi_epi64(low0, low1);
    out[2] = _mm_unpacklo_epi64(high0, high1);
    out[3] = _mm_unpackhi_epi64(high0, high1);
  }
}
#else
// The sixteen step characters of the (up to eight) outputs of one byte column, made from the
// column's byte of each step vector: character t of output b is bit b of step t's byte.
struct ColumnSteps {
  alignas(16) char steps[8][ZinMOX_Command::STEP_COUNT];
};

// Bit b of each of the eight bytes of `word` (byte t holds step t) as one byte, bit t for step t.
inline unsigned stepBits(uint64_t word, uint32_t b) {
  return static_cast<unsigned>((((word >> b) & 0x0101010101010101ull) * 0x0102040810204080ull) >>
                               56);
}
void transposeColumn(uint64_t early, uint64_t late, ColumnSteps& out) {
  for (uint32_t b = 0; b < 8; ++b) {
    std::memcpy(out.steps[b], mox::kByteBitsLsbFirst[stepBits(early, b)].data(), 8);
    std::memcpy(out.steps[b] + 8, mox::kByteBitsLsbFirst[stepBits(late, b)].data(), 8);
  }
}
#endif

}  // namespace

void ZinMOX_Command::setStepVectors(const uint8_t* vectors, uint32_t count) {
  const uint32_t stepBytes = mox::byteCount(count);
  const uint8_t* steps[STEP_COUNT];
  for (uint32_t t = 0; t < STEP_COUNT; ++t) steps[t] = vectors + t * stepBytes;
  stageStepVectors(steps, nullptr, 0, count);
}

void ZinMOX_Command::stageStepVectors(const uint8_t* const* vectors, const uint32_t* positions,
                                      uint32_t first, uint32_t count) {
  const uint32_t stepBytes = mox::byteCount(count);
  uint32_t byte = 0;
#if defined(__SSE2__)
  // Outputs base to base+outputs-1 from a column register; the trains of consecutive outputs
  // follow each other.
  const auto stage = [&](__m128i column, uint32_t base, uint32_t outputs) {
    if (positions == nullptr) {
      char* const trains = trainAt(first + base);
      stageColumn(column, outputs, [&](uint32_t b) { return trains + STEP_COUNT * b; });
    } else {
      stageColumn(column, outputs, [&](uint32_t b) { return trainAt(positions[base + b]); });
    }
  };
  for (; count - 8 * byte >= 64; byte += 8) {
    __m128i columns[8];
    transposeEightColumns(vectors, byte, columns);
    for (uint32_t j = 0; j < 8; ++j) stage(columns[j], 8 * (byte + j), 8);
  }
#else
  ColumnSteps column;
#endif
  for (; byte < stepBytes; ++byte) {
    // Byte t of `early` is the column's byte of step t, byte t of `late` that of step 8 + t;
    // assembled in registers, so the transposition does not wait on stores.
    uint64_t early = 0;
    uint64_t late = 0;
    for (uint32_t t = 0; t < 8; ++t) {
      early |= uint64_t{vectors[t][byte]} << (8 * t);
      late |= uint64_t{vectors[8 + t][byte]} << (8 * t);
    }
    const uint32_t outputs = std::min<uint32_t>(8, count - 8 * byte);
    const uint32_t base = 8 * byte;
#if defined(__SSE2__)
    stage(_mm_set_epi64x(static_cast<int64_t>(late), static_cast<int64_t>(early)), base, outputs);
#else
    transposeColumn(early, late, column);
    for (uint32_t b = 0; b < outputs; ++b)
      setPulseTrainSteps(positions != nullptr ? positions[base + b] : first + base + b,
                         column.steps[b]);
#endif
  }
}

void ZinMOX_Command::holdPulseTrainRun(uint32_t first, const uint8_t* value, uint32_t n) {
#if defined(__SSE2__)
  // Holding a level on all steps is a column whose sixteen step bytes are the value's byte.
  for (uint32_t byte = 0; 8 * byte < n; ++byte) {
    char* const trains = trainAt(first + 8 * byte);  // the eight outputs' trains follow each other
    stageColumn(_mm_set1_epi8(static_cast<char>(value[byte])), std::min<uint32_t>(8, n - 8 * byte),
                [&](uint32_t b) { return trains + STEP_COUNT * b; });
  }
#else
  for (uint32_t i = 0; i < n; ++i) {
    holdPulseTrain(first + i, ((value[i / 8] >> (i % 8)) & 1u) != 0 ? '1' : '0');
  }
#endif
  markSyncOutRun(first, n);
}

}  // namespace ZinRT
