// The port image of a MOX core: sizing, staging resets, command text and the two transfers.
#include "ZinMOX/ZinMOX_Command.h"

#include <memory>

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
      std::string data;
      data.reserve(2 * aOut + SYNC_OUT_BITS * sOut);
      data += asyncOutValueBits;
      for (const std::string& steps : syncOutPulseTrains) data += steps;
      data += asyncOutUpdateBits;
      data += syncOutUpdateBits;
      const uint32_t bitLength = static_cast<uint32_t>(data.size()) + 1;
      std::string hex;
      Zin_NumberUtil::binStr2HexStr(data, hex);
      appendLine(text, coreRef, 1, '0', bitLength, hex.empty() ? std::string("0") : hex, scratch);
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

  Zin_ByteBuffer hex;
  readData.bin2HexString(0, hex);
  const uint32_t inputBits = ASYNC_IN_BITS * aIn + SYNC_IN_BITS * sIn;
  std::string bits;
  Zin_NumberUtil::hexStr2BinStr(hex.ptr(), inputBits, bits);
  const uint32_t asyncBits = inputBits - SYNC_IN_BITS * sIn;
  if (sIn != 0) unpackSyncInputs(bits.c_str() + asyncBits);
  if (aIn != 0) unpackAsyncInputs(bits.c_str());
}

void ZinMOX_Command::unpackAsyncInputs(const char* bits) {
  const uint32_t count = moxCoreInfo.async_input_count;
  for (uint32_t i = 0; i < count; ++i, bits += ASYNC_IN_BITS) {
    asyncInValueBits[i] = bits[0];
    asyncInActivityUpBits[i] = bits[1];
    asyncInActivityDownBits[i] = bits[2];
  }
}

void ZinMOX_Command::unpackSyncInputs(const char* bits) {
  const uint32_t count = moxCoreInfo.sync_input_count;
  for (uint32_t i = 0; i < count; ++i, bits += SYNC_IN_BITS) {
    syncInValueBits[i] = bits[0];
    syncInActivityUpBits[i] = bits[1];
    syncInActivityDownBits[i] = bits[2];
    syncInSyncActivityUpBits[i] = bits[3];
    syncInSyncActivityDownBits[i] = bits[4];
  }
}

}  // namespace ZinRT
