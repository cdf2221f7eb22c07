// The library's object for one MOX core in one JTAG session.
#ifndef ZINMOX_CORE_H
#define ZINMOX_CORE_H

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "ZinMOX/ZinMOX_CoreInfo.h"
#include "ZinMOX/ZinMOX_Export.h"
#include "ZinMOX/ZinMOX_ValueMap.h"
#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_SignalCore.h"

namespace ZinRT {

class ZinMOX_SignalGroup;

/// A MOX core: its decoded status, its port image and its tables of named signals (input and
/// output; names are unique per direction and compared without regard to ASCII letter case).
/// Created by ZinMOX_initCore and owned by the framework's core list. Not copyable. Every
/// operation reports failures as std::logic_error carrying the message text.
class ZINMOX_API ZinMOX_Core : public Zin_SignalCore {
 public:
  // Status word layouts (bit offsets and lengths) for core versions below 0x62, below 0xA0, and
  // from 0xA0 on (the full layout).
  static const unsigned int BEFORE_062_ASYNC_INPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_062_SYNC_INPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_062_ASYNC_OUTPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_062_SYNC_OUTPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_062_PORT_BIT_LEN;
  static const unsigned int BEFORE_101_ASYNC_INPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_101_SYNC_INPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_101_ASYNC_OUTPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_101_SYNC_OUTPUT_COUNT_BIT_OFFSET;
  static const unsigned int BEFORE_101_PORT_BIT_LEN;
  static const unsigned int QX_MAJOR_VERSION_BIT_OFFSET;
  static const unsigned int QX_MAJOR_VERSION_BIT_LEN;
  static const unsigned int QX_MINOR_VERSION_BIT_OFFSET;
  static const unsigned int QX_MINOR_VERSION_BIT_LEN;
  static const unsigned int QX_MINOR_VERSION_ALPHA_BIT_OFFSET;
  static const unsigned int QX_MINOR_VERSION_ALPHA_BIT_LEN;
  static const unsigned int ASYNC_INPUT_COUNT_BIT_OFFSET;
  static const unsigned int SYNC_INPUT_COUNT_BIT_OFFSET;
  static const unsigned int ASYNC_OUTPUT_COUNT_BIT_OFFSET;
  static const unsigned int SYNC_OUTPUT_COUNT_BIT_OFFSET;
  static const unsigned int PORT_BIT_LEN;

  /// Decodes a MOX core's status word into `result`, choosing the layout from the core version
  /// key (major << 4) | minor. Only `coreInfo`, `status` and `result` are read.
  static void getMoxCoreStatus(uint32_t handle, ZIN_CORE_REF coreRef, const ZIN_CORE_INFO& coreInfo,
                               Zin_ByteBuffer& status, uint32_t statusBitCount,
                               ZINMOX_CORE_INFO* result);

  ZinMOX_Core(uint32_t handle, ZIN_CORE_REF coreRef, ZIN_CORE_INFO coreInfo,
              const unsigned char* status, uint32_t statusBitCount);
  ~ZinMOX_Core() override;
  ZinMOX_Core(const ZinMOX_Core&) = delete;
  ZinMOX_Core& operator=(const ZinMOX_Core&) = delete;

  /// Decodes the kept status word, pushes the port widths to the framework, sizes the port image
  /// and defines the reserved whole-port signals. Returns true.
  bool initFromStatusWord(uint32_t handle) override;

  /// The generic signal store of the framework is not used by MOX cores: these do nothing.
  void addSignal(Zin_SignalBase* signal) override;
  Zin_SignalBase* getSignal(const std::string& name, uint32_t type, uint32_t position) override;
  void removeSignal(Zin_SignalBase* signal) override;

  /// Defines "async_out_data", "sync_out_data", "async_in_data" and "sync_in_data" over each
  /// whole port of non-zero width.
  void addReservedSignals();
  /// Defines a signal or bus. `signalType`: 0 synchronous output, 1 synchronous input,
  /// 2 asynchronous output, 3 asynchronous input. A failed call leaves the tables unchanged.
  void defineSignal(const std::string& name, uint32_t signalType,
                    std::vector<uint32_t>& bitIndexes);
  /// Removes a signal: codes 1 and 3 search the inputs, any other code the outputs.
  void undefineSignal(const std::string& name, uint32_t signalType);
  /// Writes the widths of `count` named signals (outputs when `isOutput` is non-zero).
  void getSignalSizes(std::vector<std::string> names, uint32_t* sizes, uint32_t count,
                      uint32_t isOutput);

  /// Writes whole output ports: packed values and update masks, 16 step vectors for the
  /// synchronous outputs; a count of 0 leaves that port out of the write.
  void setPortBits(uint32_t handle, ZIN_CORE_REF coreRef, const uint8_t* asyncOutData,
                   const uint8_t* asyncOutUpdateMask, uint32_t asyncOutDataBitCount,
                   const uint8_t* syncOutData, const uint8_t* syncOutUpdateMask,
                   uint32_t syncOutDataBitCount);
  /// Reads whole input ports with their activity; null destinations are skipped, a count of 0
  /// fills none of that port's.
  void getPortBits(uint32_t handle, ZIN_CORE_REF coreRef, uint8_t* asyncInData,
                   uint8_t* asyncInActivityUp, uint8_t* asyncInActivityDown,
                   uint32_t asyncInDataBitCount, uint8_t* syncInData, uint8_t* syncInActivityUp,
                   uint8_t* syncInActivityDown, uint8_t* syncInSyncActivityUp,
                   uint8_t* syncInSyncActivityDown, uint32_t syncInDataBitCount);

  /// Writes named outputs from hexadecimal texts in one transfer. A key is a signal name,
  /// optionally followed by ".pulsetrain" for a 16-step train of a synchronous output.
  void writeValues(uint32_t handle, ZIN_CORE_REF coreRef, const ZinMOX_ValueMap* outputHashMap);
  /// Writes `valueCount` packed values per named output, one transfer per value, or with
  /// `burstMode` 1 up to 16 values per transfer as step vectors of synchronous outputs.
  void writeValues(uint32_t handle, ZIN_CORE_REF coreRef, std::vector<std::string> signalNames,
                   const uint8_t* const* values, const uint32_t* valueSizes, uint32_t signalCount,
                   uint32_t valueCount, uint32_t burstMode);
  /// Reads every input signal in one transfer into the map: under its name and the keys
  /// name.value, name.activity_up, name.activity_down and, for synchronous inputs,
  /// name.sync_activity_up and name.sync_activity_down.
  void readValues(uint32_t handle, ZIN_CORE_REF coreRef, ZinMOX_ValueMap* inputHashMap);
  /// Samples the named inputs `sampleCount` times, one read per sample; sample k of each signal
  /// lands at byte k*ceil(width/8) of each non-null buffer.
  void readValues(uint32_t handle, ZIN_CORE_REF coreRef, std::vector<std::string> signalNames,
                  uint8_t* const* values, uint8_t* const* activityUp, uint8_t* const* activityDown,
                  uint8_t* const* syncActivityUp, uint8_t* const* syncActivityDown,
                  const uint32_t* valueSizes, uint32_t signalCount, uint32_t sampleCount);

  /// The decoded information (all zero before initFromStatusWord).
  const ZINMOX_CORE_INFO& getMoxCoreInfo() const { return moxCoreInfo; }

 protected:
  void setCorePhysicalSignalCounts() override;

 private:
  ZINMOX_HIDDEN ZinMOX_SignalGroup* getInputSignal(const std::string& name);
  ZINMOX_HIDDEN ZinMOX_SignalGroup* getOutputSignal(const std::string& name);
  ZINMOX_HIDDEN ZinMOX_SignalGroup* requireOutputSignal(const std::string& name);
  ZINMOX_HIDDEN ZinMOX_SignalGroup* requireInputSignal(const std::string& name);

  // The port image and the two signal tables are of the library's own types, which a host
  // cannot use: they stay behind one pointer, so this declaration names nothing a host would
  // have to link.
  struct Parts;
  friend struct ZinMOX_CoreAccess;

  ZINMOX_CORE_INFO moxCoreInfo;
  std::unique_ptr<Parts> parts;
};

}  // namespace ZinRT

#endif
