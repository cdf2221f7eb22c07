// The port image of a MOX core and the encoding of its command sequences.
#ifndef ZINMOX_COMMAND_H
#define ZINMOX_COMMAND_H

#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX_CoreInfo.h"
#include "ZinMOX/ZinMOX_Export.h"
#include "ZinRT/ZinCore_Types.h"

namespace ZinRT {

/// The image of a core's four ports as '0'/'1' strings (character i is port bit i; a synchronous
/// output bit has a string of 16 step characters, all kept in one block), and the only
/// place where command text is built and sent. Writers call clearUpdateMasks, stage characters,
/// then writeOutputs; readers call readInputs, then read characters. Owned by its core (in its
/// private parts); used under the session's target lock, one thread at a time. Internal.
class ZinMOX_Command {
 public:
  static constexpr uint32_t STEP_COUNT = 16;

  /// Copies the record and sizes every string from its four port counts (all '0').
  void initFromCoreInfo(const ZINMOX_CORE_INFO& info);
  /// Sets every update character of both output groups to '0'.
  void clearUpdateMasks();
  /// Sends the whole output image (codes 01 and 02) and flushes; nothing when the core has no
  /// output bits.
  void writeOutputs(uint32_t handle, const ZIN_CORE_REF& coreRef);
  /// Reads the whole input image (codes 03 and 04); nothing when the core has no input bits.
  void readInputs(uint32_t handle, const ZIN_CORE_REF& coreRef);
  /// Renders the text of command code 1 to 4 into `text` and returns it; other codes give the
  /// empty text. Throws std::logic_error when the port image cannot give the output data (a
  /// fault of the library: only '0'/'1' and 16-step strings are ever staged). `readBitCount`, if
  /// given, receives the bits that the text reads back.
  std::string& buildCommandText(const ZIN_CORE_REF& coreRef, uint32_t code, std::string& text,
                                uint32_t* readBitCount) const;
  /// Sets the value and activity characters of the input bits from the packed read data (the
  /// input bits of the read line, its last bit in bit 0). Reads whole words: the data must hold
  /// READ_DATA_SLACK bytes past the line's.
  void unpackAsyncInputs(const unsigned char* data);
  void unpackSyncInputs(const unsigned char* data);
  static constexpr uint32_t READ_DATA_SLACK = 8;

  void setAsyncOutValueBits(std::string bits) { asyncOutValueBits = std::move(bits); }
  void setAsyncOutUpdateBits(std::string bits) { asyncOutUpdateBits = std::move(bits); }
  void setSyncOutUpdateBits(std::string bits) { syncOutUpdateBits = std::move(bits); }
  /// Sets the characters of a whole output string from `count` packed bits (bit i in bit i mod 8
  /// of byte i/8), in place: the string keeps its storage.
  void setAsyncOutValueBits(const uint8_t* packed, uint32_t count);
  void setAsyncOutUpdateBits(const uint8_t* packed, uint32_t count);
  void setSyncOutUpdateBits(const uint8_t* packed, uint32_t count);
  void setAsyncOutValueChar(uint32_t bit, char c) { asyncOutValueBits[bit] = c; }
  void setAsyncOutUpdateChar(uint32_t bit, char c) { asyncOutUpdateBits[bit] = c; }
  void setSyncOutUpdateChar(uint32_t bit, char c) { syncOutUpdateBits[bit] = c; }
  /// Sets the step string of a synchronous output bit. A string of other than STEP_COUNT
  /// characters is kept as a train the write line refuses (buildCommandText fails), never cut
  /// or padded into one it would send.
  void setPulseTrain(uint32_t bit, const std::string& steps) {
    if (steps.size() == STEP_COUNT) {
      setPulseTrainSteps(bit, steps.data());
    } else {
      holdPulseTrain(bit, UNRENDERABLE_STEP);
    }
  }
  void setPulseTrainStep(uint32_t bit, uint32_t step, char c) { trainAt(bit)[step] = c; }
  /// Sets the step strings of synchronous outputs 0 to count-1 from 16 packed step vectors
  /// (vector t at byte t*ceil(count/8)): character t of output i's string is bit i of vector t.
  void setStepVectors(const uint8_t* vectors, uint32_t count);
  /// Sets the step strings of `count` synchronous outputs from 16 packed step vectors given one
  /// by one (`vectors[t]` is step t, bit i of it for value bit i): character t of the string of
  /// output positions[i] (of output first+i when `positions` is null) is bit i of vector t.
  void stageStepVectors(const uint8_t* const* vectors, const uint32_t* positions, uint32_t first,
                        uint32_t count);
  /// Marks the synchronous outputs first to first+n-1 for update.
  void markSyncOutRun(uint32_t first, uint32_t n) {
    std::memset(syncOutUpdateBits.data() + first, '1', n);
  }
  /// Stages value bits 0 to n-1 of a packed vector on the asynchronous outputs first to
  /// first+n-1, each with its update mark (a run of consecutive port bits).
  void stageAsyncRun(uint32_t first, const uint8_t* value, uint32_t n);
  /// Holds value bits 0 to n-1 of a packed vector on all steps of the synchronous outputs first
  /// to first+n-1, each with its update mark.
  void holdPulseTrainRun(uint32_t first, const uint8_t* value, uint32_t n);
  /// Holds one level on all steps of a synchronous output bit.
  void holdPulseTrain(uint32_t bit, char level) {
    static constexpr char LOW[] = "0000000000000000";
    static constexpr char HIGH[] = "1111111111111111";
    // A fixed-size copy of one of two constant trains is a single store; other levels (only the
    // unrenderable mark) are filled.
    if (level == '0' || level == '1') {
      std::memcpy(trainAt(bit), level == '1' ? HIGH : LOW, STEP_COUNT);
    } else {
      std::memset(trainAt(bit), level, STEP_COUNT);
    }
  }
  /// Sets all STEP_COUNT step characters of a synchronous output bit from `steps`.
  void setPulseTrainSteps(uint32_t bit, const char* steps) {
    std::memcpy(trainAt(bit), steps, STEP_COUNT);
  }

  void getAsyncInChars(uint32_t bit, char& value, char& activityUp, char& activityDown) const {
    value = asyncInValueBits[bit];
    activityUp = asyncInActivityUpBits[bit];
    activityDown = asyncInActivityDownBits[bit];
  }
  void getSyncInChars(uint32_t bit, char& value, char& activityUp, char& activityDown,
                      char& syncActivityUp, char& syncActivityDown) const {
    value = syncInValueBits[bit];
    activityUp = syncInActivityUpBits[bit];
    activityDown = syncInActivityDownBits[bit];
    syncActivityUp = syncInSyncActivityUpBits[bit];
    syncActivityDown = syncInSyncActivityDownBits[bit];
  }

  const std::string& getAsyncOutValueBits() const { return asyncOutValueBits; }
  /// The step string of synchronous output `bit` (STEP_COUNT characters, step 0 first).
  std::string getPulseTrain(uint32_t bit) const {
    return syncOutSteps.substr(static_cast<size_t>(bit) * STEP_COUNT, STEP_COUNT);
  }
  /// Copies of every step string, in bit order (for checks; the image keeps them in one block).
  std::vector<std::string> getSyncOutPulseTrains() const {
    std::vector<std::string> trains;
    for (uint32_t bit = 0; bit < moxCoreInfo.sync_output_count; ++bit) {
      trains.push_back(getPulseTrain(bit));
    }
    return trains;
  }
  const std::string& getAsyncOutUpdateBits() const { return asyncOutUpdateBits; }
  const std::string& getSyncOutUpdateBits() const { return syncOutUpdateBits; }
  const std::string& getAsyncInValueBits() const { return asyncInValueBits; }
  const std::string& getAsyncInActivityUpBits() const { return asyncInActivityUpBits; }
  const std::string& getAsyncInActivityDownBits() const { return asyncInActivityDownBits; }
  const std::string& getSyncInValueBits() const { return syncInValueBits; }
  const std::string& getSyncInActivityUpBits() const { return syncInActivityUpBits; }
  const std::string& getSyncInActivityDownBits() const { return syncInActivityDownBits; }
  const std::string& getSyncInSyncActivityUpBits() const { return syncInSyncActivityUpBits; }
  const std::string& getSyncInSyncActivityDownBits() const { return syncInSyncActivityDownBits; }
  const ZINMOX_CORE_INFO& getMoxCoreInfo() const { return moxCoreInfo; }

 private:
  // Appends the hexadecimal text of D, the output data bits of the write line (`dataBits` of
  // them), without building D; false when the image holds anything but '0'/'1' (a step string
  // of the wrong length is held as characters that are not).
  bool appendDataHex(std::string& text, size_t dataBits) const;
  // The number of output data bits of the write line.
  size_t writeDataBits() const;
  // Appends the write line's data: the text of D, or "0" when the core has no outputs. Fails,
  // with the text as it was, when the image does not give D.
  void appendWriteData(std::string& text) const;

  std::string asyncOutValueBits;
  // A character that is neither '0' nor '1': a step string of another length becomes STEP_COUNT
  // of them, which the write line refuses.
  static constexpr char UNRENDERABLE_STEP = '?';
  char* trainAt(uint32_t bit) {
    return syncOutSteps.data() + static_cast<size_t>(bit) * STEP_COUNT;
  }

  // The step strings of all synchronous outputs in one block: output i's at i*STEP_COUNT, so
  // the block is the sync part of the write line's data as it is.
  std::string syncOutSteps;
  std::string asyncOutUpdateBits;
  std::string syncOutUpdateBits;
  std::string asyncInValueBits;
  std::string asyncInActivityUpBits;
  std::string asyncInActivityDownBits;
  std::string syncInValueBits;
  std::string syncInActivityUpBits;
  std::string syncInActivityDownBits;
  std::string syncInSyncActivityUpBits;
  std::string syncInSyncActivityDownBits;
  ZINMOX_CORE_INFO moxCoreInfo{};

  // Storage reused from one transfer to the next, so that a transfer on a core of unchanged
  // size allocates nothing; the lines that depend only on the reference are kept rendered.
  struct RenderedLines {
    std::string text;
    ZIN_CORE_REF ref{};
    uint32_t readBits = 0;
    bool valid = false;
  };
  // Renders `lines` with `render(text)` unless they were last rendered for `coreRef`.
  template <class Render>
  static const RenderedLines& renderedFor(RenderedLines& lines, const ZIN_CORE_REF& coreRef,
                                          Render&& render);
  RenderedLines writeHead_;  // the write line up to its data
  RenderedLines commitLine_;
  RenderedLines readLines_;
  std::string writeText_;
  std::vector<unsigned char> readData_;
};

}  // namespace ZinRT

#endif
