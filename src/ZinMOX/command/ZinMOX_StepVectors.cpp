// Step strings of synchronous outputs from packed step vectors: a bit-matrix transposition, one
// byte column (eight outputs by sixteen steps) at a time.
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

// The sixteen step characters of the (up to eight) outputs of one byte column, made from the
// column's byte of each step vector: character t of output b is bit b of step t's byte.
struct ColumnSteps {
  alignas(16) char steps[8][ZinMOX_Command::STEP_COUNT];
};

#if defined(__SSE2__)
// movemask gathers the top bit of all sixteen step bytes at once; doubling every byte moves the
// next lower bit to the top.
void transposeColumn(uint64_t early, uint64_t late, ColumnSteps& out) {
  const __m128i stepBit = _mm_set1_epi64x(static_cast<int64_t>(0x8040201008040201ull));
  const __m128i zeroChar = _mm_set1_epi8('0');
  __m128i bytes = _mm_set_epi64x(static_cast<int64_t>(late), static_cast<int64_t>(early));
  for (int b = 7; b >= 0; --b) {
    const auto mask = static_cast<uint64_t>(_mm_movemask_epi8(bytes));  // bit t: step t
    // Every byte of each half holds that half's eight step bits; byte t keeps only step t's.
    const __m128i spread =
        _mm_set_epi64x(static_cast<int64_t>((mask >> 8) * 0x0101010101010101ull),
                       static_cast<int64_t>((mask & 0xFF) * 0x0101010101010101ull));
    const __m128i set = _mm_cmpeq_epi8(_mm_and_si128(spread, stepBit), stepBit);
    const __m128i chars = _mm_sub_epi8(zeroChar, set);  // '0' - (-1) is '1'
    _mm_store_si128(reinterpret_cast<__m128i*>(out.steps[b]), chars);
    bytes = _mm_add_epi8(bytes, bytes);
  }
}
#else
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
  stageStepVectors(steps, nullptr, count);
}

void ZinMOX_Command::stageStepVectors(const uint8_t* const* vectors, const uint32_t* positions,
                                      uint32_t count) {
  const uint32_t stepBytes = mox::byteCount(count);
  ColumnSteps column;
  for (uint32_t byte = 0; byte < stepBytes; ++byte) {
    // Byte t of `early` is the column's byte of step t, byte t of `late` that of step 8 + t;
    // assembled in registers, so the transposition does not wait on stores.
    uint64_t early = 0;
    uint64_t late = 0;
    for (uint32_t t = 0; t < 8; ++t) {
      early |= uint64_t{vectors[t][byte]} << (8 * t);
      late |= uint64_t{vectors[8 + t][byte]} << (8 * t);
    }
    transposeColumn(early, late, column);
    const uint32_t outputs = std::min<uint32_t>(8, count - 8 * byte);
    for (uint32_t b = 0; b < outputs; ++b) {
      const uint32_t bit = 8 * byte + b;
      setPulseTrainSteps(positions != nullptr ? positions[bit] : bit, column.steps[b]);
    }
  }
}

}  // namespace ZinRT
