// The port image of a MOX core: sizing, staging resets, command text and the two transfers.
#include "internal/ZinMOX_Command.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <iterator>
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

// '1' or '0' for bit `bit` of packed data.
char bitChar(const unsigned char* data, uint32_t bit) {
  return ((data[bit / 8] >> (bit % 8)) & 1u) != 0 ? '1' : '0';
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

std::string& ZinMOX_Command::buildCommandText(const ZIN_CORE_REF& coreRef, uint32_t code,
                                              std::string& text, uint32_t* readBitCount) const {
  if (readBitCount != nullptr) *readBitCount = 0;
  text.clear();
  std::string scratch;
  switch (code) {
    case 1: {
      const size_t dataBits = writeDataBits();
      // Room for this line and the short line that follows it in a write, so that neither the
      // line nor the sequence is copied on growing.
      text.reserve(dataBits / 4 + 2 * SHORT_LINE_LENGTH);
      appendLine(text, coreRef, 1, '0', static_cast<uint32_t>(dataBits + 1), "", scratch);
      appendWriteData(text);
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

size_t ZinMOX_Command::writeDataBits() const {
  // D: the asynchronous values, the step strings in bit order, then both update masks.
  return 2 * static_cast<size_t>(moxCoreInfo.async_output_count) +
         SYNC_OUT_BITS * static_cast<size_t>(moxCoreInfo.sync_output_count);
}

void ZinMOX_Command::appendWriteData(std::string& text) const {
  const size_t dataBits = writeDataBits();
  const size_t dataStart = text.size();
  if (dataBits == 0) {
    text += '0';
  } else if (!appendDataHex(text, dataBits)) {
    // Every writer stages only '0'/'1' and whole step strings: a text that fails its own check
    // is a fault of the library, and no wrong data may reach the wire.
    text.resize(dataStart);
    throw std::logic_error("ZinMOX_Command::buildCommandText(): the port image does not give " +
                           std::to_string(dataBits) + " bits of output data");
  }
}

template <class Render>
const ZinMOX_Command::RenderedLines& ZinMOX_Command::renderedFor(RenderedLines& lines,
                                                                 const ZIN_CORE_REF& coreRef,
                                                                 Render&& render) {
  if (!lines.valid || !sameRef(lines.ref, coreRef)) {
    lines.valid = false;
    render(lines.text);
    lines.ref = coreRef;
    lines.valid = true;
  }
  return lines;
}

bool ZinMOX_Command::appendDataHex(std::string& text, size_t dataBits) const {
  mox::HexTextWriter writer(text, dataBits);
  return writer.add(asyncOutValueBits) && writer.add(syncOutSteps) &&
         writer.add(asyncOutUpdateBits) && writer.add(syncOutUpdateBits) && writer.done();
}

void ZinMOX_Command::writeOutputs(uint32_t handle, const ZIN_CORE_REF& coreRef) {
  if (moxCoreInfo.async_output_count == 0 && moxCoreInfo.sync_output_count == 0) return;
  // The sequence is rendered into storage kept from the last write. The write line's fields
  // before its data and the code-02 line depend only on the reference and the port widths: they
  // are rendered again only when the reference changes.
  const std::string& head =
      renderedFor(writeHead_, coreRef, [&](std::string& line) {
        line.clear();
        std::string scratch;
        appendLine(line, coreRef, 1, '0', static_cast<uint32_t>(writeDataBits() + 1), "", scratch);
      }).text;
  const std::string& commit = renderedFor(commitLine_, coreRef, [&](std::string& line) {
                                buildCommandText(coreRef, 2, line, nullptr);
                              }).text;
  std::string& text = writeText_;
  text.reserve(head.size() + writeDataBits() / 4 + 2 + commit.size());
  text.assign(head);
  appendWriteData(text);
  text += '\n';
  text += commit;
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
  renderedFor(readLines_, coreRef, [&](std::string& lines) {
    buildCommandText(coreRef, 3, lines, &readLines_.readBits);
  });
  const uint32_t readBits = readLines_.readBits;
  readData_.resize(mox::byteCount(readBits) + READ_DATA_SLACK);
  Zin_CoreComm::commandSequence(handle, readLines_.text, readData_.data(), readBits, nullptr);
  if (sIn != 0) unpackSyncInputs(readData_.data());
  if (aIn != 0) unpackAsyncInputs(readData_.data());
}

// The read line carries the inputs last bit first: read from its end, the packed data hold the
// synchronous inputs from bit 0, the last input lowest, then the asynchronous ones likewise.
// Input i's fields (value first) are the top bits of its group of bits, most significant first.
// Eight inputs at a time, each field's eight bits are gathered into a byte whose bit text (most
// significant bit first) is the eight characters of inputs i to i+7.

void ZinMOX_Command::unpackSyncInputs(const unsigned char* data) {
  const uint32_t count = moxCoreInfo.sync_input_count;
  char* const fields[] = {syncInValueBits.data(), syncInActivityUpBits.data(),
                          syncInActivityDownBits.data(), syncInSyncActivityUpBits.data(),
                          syncInSyncActivityDownBits.data()};
  constexpr uint32_t top = SYNC_IN_BITS - 1;  // the bit of field 0 within an input's group
  uint32_t i = 0;
  for (; i + 8 <= count; i += 8) {
    const uint32_t first = SYNC_IN_BITS * (count - 8 - i);  // the lowest bit of inputs i..i+7
    const uint64_t word = mox::loadPacked(data + first / 8) >> (first % 8);
    for (uint32_t k = 0; k < std::size(fields); ++k) {
      const unsigned byte = mox::gatherEverySixth(word >> (top - k));
      std::memcpy(fields[k] + i, mox::kByteBitsMsbFirst[byte].data(), 8);
    }
  }
  for (; i < count; ++i) {
    const uint32_t first = SYNC_IN_BITS * (count - 1 - i);
    for (uint32_t k = 0; k < std::size(fields); ++k) fields[k][i] = bitChar(data, first + top - k);
  }
}

void ZinMOX_Command::unpackAsyncInputs(const unsigned char* data) {
  const uint32_t count = moxCoreInfo.async_input_count;
  char* const fields[] = {asyncInValueBits.data(), asyncInActivityUpBits.data(),
                          asyncInActivityDownBits.data()};
  constexpr uint32_t top = ASYNC_IN_BITS - 1;
  const uint32_t base = SYNC_IN_BITS * moxCoreInfo.sync_input_count;
  uint32_t i = 0;
  for (; i + 8 <= count; i += 8) {
    const uint32_t first = base + ASYNC_IN_BITS * (count - 8 - i);
    const uint64_t word = mox::loadPacked(data + first / 8) >> (first % 8);
    for (uint32_t k = 0; k < std::size(fields); ++k) {
      const unsigned byte = mox::gatherEveryFourth(word >> (top - k));
      std::memcpy(fields[k] + i, mox::kByteBitsMsbFirst[byte].data(), 8);
    }
  }
  for (; i < count; ++i) {
    const uint32_t first = base + ASYNC_IN_BITS * (count - 1 - i);
    for (uint32_t k = 0; k < std::size(fields); ++k) fields[k][i] = bitChar(data, first + top - k);
  }
}

}  // namespace ZinRT
