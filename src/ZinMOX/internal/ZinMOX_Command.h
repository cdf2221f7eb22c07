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

/// The image of a core's four ports as '0'/'1' strings (character i is port bit i), and the only
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
  /// Copies value and activity characters of the input bits out of the read bit text.
  void unpackAsyncInputs(const char* bits);
  void unpackSyncInputs(const char* bits);

  void setAsyncOutValueBits(std::string bits) { asyncOutValueBits = std::move(bits); }
  void setAsyncOutUpdateBits(std::string bits) { asyncOutUpdateBits = std::move(bits); }
  void setSyncOutUpdateBits(std::string bits) { syncOutUpdateBits = std::move(bits); }
  void setAsyncOutValueChar(uint32_t bit, char c) { asyncOutValueBits[bit] = c; }
  void setAsyncOutUpdateChar(uint32_t bit, char c) { asyncOutUpdateBits[bit] = c; }
  void setSyncOutUpdateChar(uint32_t bit, char c) { syncOutUpdateBits[bit] = c; }
  void setPulseTrain(uint32_t bit, std::string steps) {
    syncOutPulseTrains[bit] = std::move(steps);
  }
  void setPulseTrainStep(uint32_t bit, uint32_t step, char c) { syncOutPulseTrains[bit][step] = c; }
  /// Sets the step strings of synchronous outputs 0 to count-1 from 16 packed step vectors
  /// (vector t at byte t*ceil(count/8)): character t of output i's string is bit i of vector t.
  void setStepVectors(const uint8_t* vectors, uint32_t count);
  /// Holds one level on all steps of a synchronous output bit, without building a step string.
  void holdPulseTrain(uint32_t bit, char level) {
    std::string& steps = syncOutPulseTrains[bit];
    if (steps.size() == STEP_COUNT) {
      std::memset(steps.data(), level, STEP_COUNT);
    } else {
      steps.assign(STEP_COUNT, level);
    }
  }
  /// Sets all STEP_COUNT step characters of a synchronous output bit from `steps`.
  void setPulseTrainSteps(uint32_t bit, const char* steps) {
    std::string& train = syncOutPulseTrains[bit];
    if (train.size() == STEP_COUNT) {
      std::memcpy(train.data(), steps, STEP_COUNT);
    } else {
      train.assign(steps, STEP_COUNT);
    }
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
  const std::vector<std::string>& getSyncOutPulseTrains() const { return syncOutPulseTrains; }
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
  // them), without building D; false when the image holds anything but '0'/'1' or irregular
  // step strings.
  bool appendDataHex(std::string& text, size_t dataBits) const;

  std::string asyncOutValueBits;
  std::vector<std::string> syncOutPulseTrains;
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
};

}  // namespace ZinRT

#endif
