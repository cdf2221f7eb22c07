// The port image of a MOX core: sizing, staging resets, command text and the two transfers.
#include "internal/ZinMOX_Command.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>
#include <stdexcept>

#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_Transport.h"
#include "format/ZinMOX_BitFormat.h"
#include "framework/ZinMOX_Framework.h"

namespace ZinRT {

namespace {

// Bits per asynchronous and synchronous input bit in the read data.
constexpr uint32_t ASYNC_IN_BITS = 4;
constexpr uint32_t SYNC_IN_BITS = 6;
// Bits per synchronous output bit in the write data: 16 steps and its update character.
constexpr uint32_t SYNC_OUT_BITS = ZinMOX_Command::STEP_COUNT + 1;
// Further bits that the first read line shifts beyond the input data.
constexpr uint32_t READ_TRAILER_BITS = 16;

// Characters of a line without its data: "DD C I CC F LLLLLLLL " and the newline.
constexpr size_t SHORT_LINE_LENGTH = 22 + 1;

// `value` as `widthBits`/4 upper-case hex digits and a blank. A value that does not fit is
// left to the framework's conversion, which fails with its own message.
void appendField(std::string& text, uint32_t value, uint32_t widthBits, std::string& scratch) {
  const uint32_t digits = widthBits / 4;
  if (digits > 8 || (digits < 8 && (static_cast<uint64_t>(value) >> (4 * digits)) != 0)) {
    text += Zin_NumberUtil::uInt2HexStr(value, widthBits, scratch);
    text += ' ';
    return;
  }
  char field[9];
  for (uint32_t k = 0; k < digits; ++k)
    field[digits - 1 - k] = mox::kHexDigits[(value >> (4 * k)) & 0x0F];
  field[digits] = ' ';
  text.append(field, digits + 1);
}

// "DD C I " of a core reference: two, one and one hex digits, each followed by a blank.
void appendRefPrefix(std::string& text, const ZIN_CORE_REF& ref, std::string& scratch) {
  appendField(text, ref.deviceIndex, 8, scratch);
  appendField(text, ref.userChainNumber, 4, scratch);
  appendField(text, ref.coreIndex, 4, scratch);
}

// One line: prefix, code, read flag, bit length, data.
void appendLine(std::string& text, const ZIN_CORE_REF& ref, uint32_t code, char readFlag,
                uint32_t bitLength, const std::string& data, std::string& scratch) {
  appendRefPrefix(text, ref, scratch);
  appendField(text, code, 8, scratch);
  text += readFlag;
  text += ' ';
  appendField(text, bitLength, 32, scratch);
  text += data;
}

bool sameRef(const ZIN_CORE_REF& a, const ZIN_CORE_REF& b) {
  return a.deviceIndex == b.deviceIndex && a.userChainNumber == b.userChainNumber &&
         a.coreIndex == b.coreIndex;
}

}  // namespace

void ZinMOX_Command::initFromCoreInfo(const ZINMOX_CORE_INFO& info) {
  moxCoreInfo = info;
  asyncOutValueBits.append(info.async_output_count, '0');
  asyncOutUpdateBits.append(info.async_output_count, '0');
  syncOutSteps.append(static_cast<size_t>(info.sync_output_count) * STEP_COUNT, '0');
  syncOutUpdateBits.append(info.sync_output_count, '0');
  for (std::string* field : {&asyncInValueBits, &asyncInActivityUpBits, &asyncInActivityDownBits}) {
    field->append(info.async_input_count, '0');
  }
  for (std::string* field : {&syncInValueBits, &syncInActivityUpBits, &syncInActivityDownBits,
                             &syncInSyncActivityUpBits, &syncInSyncActivityDownBits}) {
    field->append(info.sync_input_count, '0');
  }
}

void ZinMOX_Command::clearUpdateMasks() {
  asyncOutUpdateBits.assign(asyncOutUpdateBits.size(), '0');
  syncOutUpdateBits.assign(syncOutUpdateBits.size(), '0');
}

void ZinMOX_Command::setAsyncOutValueBits(const uint8_t* packed, uint32_t count) {
  Zin_NumberUtil::bin2ReverseBinStr(packed, count, asyncOutValueBits);
}

void ZinMOX_Command::setAsyncOutUpdateBits(const uint8_t* packed, uint32_t count) {
  Zin_NumberUtil::bin2ReverseBinStr(packed, count, asyncOutUpdateBits);
}

void ZinMOX_Command::setSyncOutUpdateBits(const uint8_t* packed, uint32_t count) {
  Zin_NumberUtil::bin2ReverseBinStr(packed, count, syncOutUpdateBits);
}

void ZinMOX_Command::stageAsyncRun(uint32_t first, const uint8_t* value, uint32_t n) {
  char* chars = asyncOutValueBits.data() + first;
  uint32_t i = 0;
  for (; i + 8 <= n; i += 8) std::memcpy(chars + i, mox::kByteBitsLsbFirst[value[i / 8]].data(), 8);
  for (; i < n; ++i) chars[i] = ((value[i / 8] >> (i % 8)) & 1u) != 0 ? '1' : '0';
  std::memset(asyncOutUpdateBits.data() + first, '1', n);
}

void ZinMOX_Command::holdPulseTrainRun(uint32_t first, const uint8_t* value, uint32_t n) {
  for (uint32_t i = 0; i < n; ++i) {
    holdPulseTrain(first + i, ((value[i / 8] >> (i % 8)) & 1u) != 0 ? '1' : '0');
  }
  std::memset(syncOutUpdateBits.data() + first, '1', n);
}

std::string& ZinMOX_Command::buildCommandText(const ZIN_CORE_REF& coreRef, uint32_t code,
                                              std::string& text, uint32_t* readBitCount) const {
  if (readBitCount != nullptr) *readBitCount = 0;
  text.clear();
  std::string scratch;
  const uint32_t aOut = moxCoreInfo.async_output_count;
  const uint32_t sOut = moxCoreInfo.sync_output_count;
  switch (code) {
    case 1: {
      // D: the asynchronous values, the step strings in bit order, then both update masks. Its
      // hexadecimal text is written straight after the line's other fields.
      const size_t dataBits =
          2 * static_cast<size_t>(aOut) + SYNC_OUT_BITS * static_cast<size_t>(sOut);
      // Room for this line and the short line that follows it in a write, so that neither the
      // line nor the sequence is copied on growing.
      text.reserve(dataBits / 4 + 2 * SHORT_LINE_LENGTH);
      appendLine(text, coreRef, 1, '0', static_cast<uint32_t>(dataBits + 1), "", scratch);
      const size_t dataStart = text.size();
      if (dataBits == 0) {
        text += '0';
      } else if (!appendDataHex(text, dataBits)) {
        // Every writer stages only '0'/'1' and whole step strings: a text that fails its own
        // check is a fault of the library, and no wrong data may reach the wire.
        text.resize(dataStart);
        throw std::logic_error("ZinMOX_Command::buildCommandText(): the port image does not give " +
                               std::to_string(dataBits) + " bits of output data");
      }
      break;
    }
    case 2:
      appendLine(text, coreRef, 2, '0', 4, "0", scratch);
      break;
    case 3: {
      const uint32_t length = ASYNC_IN_BITS * moxCoreInfo.async_input_count +
                              SYNC_IN_BITS * moxCoreInfo.sync_input_count + READ_TRAILER_BITS;
      appendLine(text, coreRef, 3, '1', length, "0", scratch);
      text += '\n';
      appendLine(text, coreRef, 4, '1', 4, "0", scratch);
      // Each read line returns whole bytes: the first ceil(length/8), the four-bit line one.
      if (readBitCount != nullptr) *readBitCount = 8 * mox::byteCount(length) + 8;
      break;
    }
    default:
      break;
  }
  return text;
}

bool ZinMOX_Command::appendDataHex(std::string& text, size_t dataBits) const {
  mox::HexTextWriter writer(text, dataBits);
  return writer.add(asyncOutValueBits) && writer.add(syncOutSteps) &&
         writer.add(asyncOutUpdateBits) && writer.add(syncOutUpdateBits) && writer.done();
}

void ZinMOX_Command::writeOutputs(uint32_t handle, const ZIN_CORE_REF& coreRef) {
  if (moxCoreInfo.async_output_count == 0 && moxCoreInfo.sync_output_count == 0) return;
  // The sequence is rendered into storage kept from the last write; the code-02 line depends
  // only on the reference and is rendered again only when the reference changes.
  if (!commitLine_.valid || !sameRef(commitLine_.ref, coreRef)) {
    commitLine_.valid = false;
    buildCommandText(coreRef, 2, commitLine_.text, nullptr);
    commitLine_.ref = coreRef;
    commitLine_.valid = true;
  }
  std::string& text = writeText_;
  buildCommandText(coreRef, 1, text, nullptr);
  text += '\n';
  text += commitLine_.text;
  // The sequence and its flush go to the transport together: a remote target carries both in
  // one round trip.
  ZinJtag_session_withTransport(handle, [t = &text](ZinRT::Zin_Transport& transport) {
    transport.commandSequenceThenFlush(*t, nullptr, 0);
  });
}

void ZinMOX_Command::readInputs(uint32_t handle, const ZIN_CORE_REF& coreRef) {
  const uint32_t aIn = moxCoreInfo.async_input_count;
  const uint32_t sIn = moxCoreInfo.sync_input_count;
  if (aIn == 0 && sIn == 0) return;
  // The read sequence depends only on the reference and the port widths: rendered again only
  // when the reference changes.
  if (!readLines_.valid || !sameRef(readLines_.ref, coreRef)) {
    readLines_.valid = false;
    buildCommandText(coreRef, 3, readLines_.text, &readLines_.readBits);
    readLines_.ref = coreRef;
    readLines_.valid = true;
  }
  const uint32_t readBits = readLines_.readBits;
  readData_.resize(mox::byteCount(readBits));
  Zin_CoreComm::commandSequence(handle, readLines_.text, readData_.data(), readBits, nullptr);

  const uint32_t inputBits = ASYNC_IN_BITS * aIn + SYNC_IN_BITS * sIn;
  std::string& bits = readBitText_;
  mox::msbFirstBitText(readData_.data(), inputBits, bits);
  const uint32_t asyncBits = inputBits - SYNC_IN_BITS * sIn;
  if (sIn != 0) unpackSyncInputs(bits.c_str() + asyncBits);
  if (aIn != 0) unpackAsyncInputs(bits.c_str());
}

void ZinMOX_Command::unpackAsyncInputs(const char* bits) {
  const uint32_t count = moxCoreInfo.async_input_count;
  char* value = asyncInValueBits.data();
  char* up = asyncInActivityUpBits.data();
  char* down = asyncInActivityDownBits.data();
  for (uint32_t i = 0; i < count; ++i, bits += ASYNC_IN_BITS) {
    value[i] = bits[0];
    up[i] = bits[1];
    down[i] = bits[2];
  }
}

void ZinMOX_Command::unpackSyncInputs(const char* bits) {
  const uint32_t count = moxCoreInfo.sync_input_count;
  char* value = syncInValueBits.data();
  char* up = syncInActivityUpBits.data();
  char* down = syncInActivityDownBits.data();
  char* syncUp = syncInSyncActivityUpBits.data();
  char* syncDown = syncInSyncActivityDownBits.data();
  for (uint32_t i = 0; i < count; ++i, bits += SYNC_IN_BITS) {
    value[i] = bits[0];
    up[i] = bits[1];
    down[i] = bits[2];
    syncUp[i] = bits[3];
    syncDown[i] = bits[4];
  }
}

}  // namespace ZinRT
