// A core of the framework that has signals and keeps its status word.
#ifndef ZINRT_ZIN_SIGNALCORE_H
#define ZINRT_ZIN_SIGNALCORE_H

#include <map>
#include <string>
#include <vector>

#include "ZinRT/Zin_ByteBuffer.h"
#include "ZinRT/Zin_Core.h"
#include "ZinRT/Zin_SignalBase.h"

namespace ZinRT {

/// A core with a status word, physical signal counts per signal type, and a generic signal store.
class ZINCORE_API Zin_SignalCore : public Zin_Core {
 public:
  /// Keeps a copy of the ceil(statusBitCount/8) status bytes (null reads as zeros).
  Zin_SignalCore(uint32_t handle, ZIN_CORE_REF coreRef, ZIN_CORE_INFO coreInfo,
                 const unsigned char* status, uint32_t statusBitCount);
  ~Zin_SignalCore() override;

  /// Generic signal store: signals are kept (not owned) in adding order. A null signal throws
  /// std::invalid_argument.
  virtual void addSignal(Zin_SignalBase* signal);
  /// The first stored signal with this name, type and position, or null. Only single signals
  /// (Zin_Signal) have a position; other signals match on name and type alone.
  virtual Zin_SignalBase* getSignal(const std::string& name, uint32_t type, uint32_t position);
  /// Drops every entry of `signal` from the store (the signal itself is not destroyed).
  virtual void removeSignal(Zin_SignalBase* signal);

  /// Number of port bits of a signal type, as last set (0 if never set).
  uint32_t getCorePhysicalSignalCount(uint32_t type) const;
  void setCorePhysicalSignalCount(uint32_t type, uint32_t count);

  /// The status word kept from construction.
  Zin_ByteBuffer& getStatusBuffer() { return status_; }
  const Zin_ByteBuffer& getStatusBuffer() const { return status_; }

 protected:
  /// Hook through which a derived core sets its physical signal counts; the base does nothing.
  virtual void setCorePhysicalSignalCounts();

  Zin_SignalCore(const Zin_SignalCore&) = default;
  Zin_SignalCore& operator=(const Zin_SignalCore&) = default;

 private:
  Zin_ByteBuffer status_;
  std::map<uint32_t, uint32_t> physicalCounts_;
  std::vector<Zin_SignalBase*> signals_;
};

}  // namespace ZinRT

#endif
