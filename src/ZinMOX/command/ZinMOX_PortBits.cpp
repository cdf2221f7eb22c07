// Whole-port writes and reads of a MOX core.
#include <algorithm>
#include <array>
#include <cstring>
#include <stdexcept>
#if defined(__SSE2__)
#include <emmintrin.h>
#endif
#include <string>
#include <utility>

#include "ZinMOX/ZinMOX_Core.h"
#include "framework/ZinMOX_Framework.h"

namespace ZinRT {

namespace {

// Packs a port string into a caller's vector, skipping null destinations.
void packInto(uint8_t* destination, const std::string& bits) {
  if (destination != nullptr) Zin_NumberUtil::reverseBinStr2Bin(bits, destination);
}

// The step strings of the (up to eight) outputs of one byte column, made from the column's bytes
// of the sixteen step vectors: character t of output b's string becomes bit b of step t's byte.
struct ColumnSteps {
  char steps[8][ZinMOX_Command::STEP_COUNT];
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
    _mm_storeu_si128(reinterpret_cast<__m128i*>(out.steps[b]), chars);
    bytes = _mm_add_epi8(bytes, bytes);
  }
}
#else
// Character i of entry b is bit i of byte b.
constexpr std::array<std::array<char, 8>, 256> BIT_CHARS = [] {
  std::array<std::array<char, 8>, 256> table{};
  for (unsigned b = 0; b < 256; ++b) {
    for (unsigned i = 0; i < 8; ++i) table[b][i] = ((b >> i) & 1u) != 0 ? '1' : '0';
  }
  return table;
}();

// Bit b of each of the eight bytes of `word` (byte t holds step t) as one byte, bit t for step t.
inline unsigned stepBits(uint64_t word, uint32_t b) {
  return static_cast<unsigned>((((word >> b) & 0x0101010101010101ull) * 0x0102040810204080ull) >>
                               56);
}
void transposeColumn(uint64_t early, uint64_t late, ColumnSteps& out) {
  for (uint32_t b = 0; b < 8; ++b) {
    std::memcpy(out.steps[b], BIT_CHARS[stepBits(early, b)].data(), 8);
    std::memcpy(out.steps[b] + 8, BIT_CHARS[stepBits(late, b)].data(), 8);
  }
}
#endif

// Stages the step strings of `count` synchronous outputs from 16 packed step vectors (vector t
// at byte t*ceil(count/8)): character t of output i's string is bit i of vector t. Works one
// byte column (eight outputs) at a time.
void stageStepVectors(ZinMOX_Command& command, const uint8_t* vectors, uint32_t count) {
  const uint32_t stepBytes = mox::byteCount(count);
  ColumnSteps steps;
  for (uint32_t byte = 0; byte < stepBytes; ++byte) {
    // Byte t of `early` is the column's byte of step t, byte t of `late` that of step 8 + t;
    // assembled in registers, so the transposition does not wait on stores.
    uint64_t early = 0;
    uint64_t late = 0;
    for (uint32_t t = 0; t < 8; ++t) {
      early |= uint64_t{vectors[t * stepBytes + byte]} << (8 * t);
      late |= uint64_t{vectors[(8 + t) * stepBytes + byte]} << (8 * t);
    }
    transposeColumn(early, late, steps);
    const uint32_t bits = std::min<uint32_t>(8, count - 8 * byte);
    for (uint32_t b = 0; b < bits; ++b) command.setPulseTrainSteps(8 * byte + b, steps.steps[b]);
  }
}

// A member caller (not only the exported functions) may pass a count; one that is neither 0 nor
// the port's width would index past the port image.
void checkPortCount(uint32_t count, uint32_t width, const char* function, const char* name) {
  if (count != 0 && count != width) {
    throw std::logic_error(std::string("ZinMOX_Core::") + function + "(): " + name + " " +
                           std::to_string(count) + " is neither 0 nor the port width " +
                           std::to_string(width));
  }
}

}  // namespace

void ZinMOX_Core::setPortBits(uint32_t handle, ZIN_CORE_REF coreRef, const uint8_t* asyncOutData,
                              const uint8_t* asyncOutUpdateMask, uint32_t asyncOutDataBitCount,
                              const uint8_t* syncOutData, const uint8_t* syncOutUpdateMask,
                              uint32_t syncOutDataBitCount) {
  checkPortCount(asyncOutDataBitCount, moxCoreInfo.async_output_count, "setPortBits",
                 "asyncOutDataBitCount");
  checkPortCount(syncOutDataBitCount, moxCoreInfo.sync_output_count, "setPortBits",
                 "syncOutDataBitCount");
  command.clearUpdateMasks();
  // Each converted string is moved into the image (the image's old string goes), not copied.
  std::string bits;
  if (asyncOutDataBitCount != 0) {
    command.setAsyncOutValueBits(
        std::move(Zin_NumberUtil::bin2ReverseBinStr(asyncOutData, asyncOutDataBitCount, bits)));
    command.setAsyncOutUpdateBits(std::move(
        Zin_NumberUtil::bin2ReverseBinStr(asyncOutUpdateMask, asyncOutDataBitCount, bits)));
  }
  if (syncOutDataBitCount != 0) {
    command.setSyncOutUpdateBits(
        std::move(Zin_NumberUtil::bin2ReverseBinStr(syncOutUpdateMask, syncOutDataBitCount, bits)));
    stageStepVectors(command, syncOutData, syncOutDataBitCount);
  }
  command.writeOutputs(handle, coreRef);
}

void ZinMOX_Core::getPortBits(uint32_t handle, ZIN_CORE_REF coreRef, uint8_t* asyncInData,
                              uint8_t* asyncInActivityUp, uint8_t* asyncInActivityDown,
                              uint32_t asyncInDataBitCount, uint8_t* syncInData,
                              uint8_t* syncInActivityUp, uint8_t* syncInActivityDown,
                              uint8_t* syncInSyncActivityUp, uint8_t* syncInSyncActivityDown,
                              uint32_t syncInDataBitCount) {
  checkPortCount(asyncInDataBitCount, moxCoreInfo.async_input_count, "getPortBits",
                 "asyncInDataBitCount");
  checkPortCount(syncInDataBitCount, moxCoreInfo.sync_input_count, "getPortBits",
                 "syncInDataBitCount");
  command.readInputs(handle, coreRef);
  if (asyncInDataBitCount != 0) {
    packInto(asyncInData, command.getAsyncInValueBits());
    packInto(asyncInActivityUp, command.getAsyncInActivityUpBits());
    packInto(asyncInActivityDown, command.getAsyncInActivityDownBits());
  }
  if (syncInDataBitCount != 0) {
    packInto(syncInData, command.getSyncInValueBits());
    packInto(syncInActivityUp, command.getSyncInActivityUpBits());
    packInto(syncInActivityDown, command.getSyncInActivityDownBits());
    packInto(syncInSyncActivityUp, command.getSyncInSyncActivityUpBits());
    packInto(syncInSyncActivityDown, command.getSyncInSyncActivityDownBits());
  }
}

}  // namespace ZinRT
