// The port image of a MOX core: sizing, staging resets, command text and the two transfers.
#include "internal/ZinMOX_Command.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>
#include <stdexcept>

#include "format/ZinMOX_BitFormat.h"
#include "framework/ZinMOX_Framework.h"

namespace ZinRT {

namespace {

constexpr char STEPS_OF_ZERO[] = "0000000000000000";
// Bits per asynchronous and synchronous input bit in the read data.
constexpr uint32_t ASYNC_IN_BITS = 4;
constexpr uint32_t SYNC_IN_BITS = 6;
// Bits per synchronous output bit in the write data: 16 steps and its update character.
constexpr uint32_t SYNC_OUT_BITS = ZinMOX_Command::STEP_COUNT + 1;
// Further bits that the first read line shifts beyond the input data.
constexpr uint32_t READ_TRAILER_BITS = 16;

// Characters of a line without its data: "DD C I CC F LLLLLLLL " and the newline.
constexpr size_t SHORT_LINE_LENGTH = 22 + 1;

// "DD C I " of a core reference: two, one and one hex digits, each followed by a blank.
void appendRefPrefix(std::string& text, const ZIN_CORE_REF& ref, std::string& scratch) {
  text += Zin_NumberUtil::uInt2HexStr(ref.deviceIndex, 8, scratch);
  text += ' ';
  text += Zin_NumberUtil::uInt2HexStr(ref.userChainNumber, 4, scratch);
  text += ' ';
  text += Zin_NumberUtil::uInt2HexStr(ref.coreIndex, 4, scratch);
  text += ' ';
}

// One line: prefix, code, read flag, bit length, data.
void appendLine(std::string& text, const ZIN_CORE_REF& ref, uint32_t code, char readFlag,
                uint32_t bitLength, const std::string& data, std::string& scratch) {
  appendRefPrefix(text, ref, scratch);
  text += Zin_NumberUtil::uInt2HexStr(code, 8, scratch);
  text += ' ';
  text += readFlag;
  text += ' ';
  text += Zin_NumberUtil::uInt2HexStr(bitLength, 32, scratch);
  text += ' ';
  text += data;
}

}  // namespace

void ZinMOX_Command::initFromCoreInfo(const ZINMOX_CORE_INFO& info) {
  moxCoreInfo = info;
  asyncOutValueBits.append(info.async_output_count, '0');
  asyncOutUpdateBits.append(info.async_output_count, '0');
  syncOutPulseTrains.insert(syncOutPulseTrains.end(), info.sync_output_count,
                            std::string(STEPS_OF_ZERO));
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
  if (!writer.add(asyncOutValueBits)) return false;
  for (const std::string& steps : syncOutPulseTrains) {
    if (steps.size() != STEP_COUNT || !writer.addSteps(steps.data())) return false;
  }
  return writer.add(asyncOutUpdateBits) && writer.add(syncOutUpdateBits) && writer.done();
}

void ZinMOX_Command::writeOutputs(uint32_t handle, const ZIN_CORE_REF& coreRef) {
  if (moxCoreInfo.async_output_count == 0 && moxCoreInfo.sync_output_count == 0) return;
  std::string text;
  std::string commitLine;
  buildCommandText(coreRef, 1, text, nullptr);
  text += '\n';
  text += buildCommandText(coreRef, 2, commitLine, nullptr);
  Zin_CoreComm::commandSequence(handle, text, nullptr, 0, nullptr);
  ZinJtag_target_flush(handle);
}

void ZinMOX_Command::readInputs(uint32_t handle, const ZIN_CORE_REF& coreRef) {
  const uint32_t aIn = moxCoreInfo.async_input_count;
  const uint32_t sIn = moxCoreInfo.sync_input_count;
  if (aIn == 0 && sIn == 0) return;
  std::string text;
  uint32_t readBits = 0;
  buildCommandText(coreRef, 3, text, &readBits);
  Zin_ByteBuffer readData(mox::byteCount(readBits), 0, 0);
  Zin_CoreComm::commandSequence(handle, text, readData.uPtr(), readBits, nullptr);

  const uint32_t inputBits = ASYNC_IN_BITS * aIn + SYNC_IN_BITS * sIn;
  std::string bits;
  mox::msbFirstBitText(readData.uPtr(), inputBits, bits);
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
