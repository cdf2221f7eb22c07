// The simulated JTAG target: a chain of devices whose user chains hold behavioural MOX cores
// (and cores of other types), reached through the transport seam.
#ifndef ZINSIM_TARGET_H
#define ZINSIM_TARGET_H

#include <cstdint>
#include <exception>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "ZinRT/Zin_Transport.h"
#include "ZinSim/Description.h"
#include "ZinSim/ZinSim_Export.h"

namespace ZinSim {

/// A simulated target. Every operation takes one mutex, so one target may be shared by several
/// sessions and threads. Behaviour and description format: docs/target.md.
///
///   auto target = std::make_shared<ZinSim::Target>();            // the demo design
///   auto other = std::make_shared<ZinSim::Target>(ZinSim::loadDescription("board.json"));
///   uint32_t handle = ZinJtag_openSession(target);
class ZINSIM_API Target : public ZinRT::Zin_Transport {
 public:
  /// The built-in demo design (demoDescription()).
  Target();
  /// Throws DescriptionError (pointer relative to the flat core list, "/cores/2/...") when the
  /// description does not pass findProblem.
  explicit Target(const TargetDescription& description);
  ~Target() override;
  Target(const Target&) = delete;
  Target& operator=(const Target&) = delete;

  // The transport seam. A command sequence is checked as a whole before any line takes effect;
  // a bad line throws std::runtime_error("ZinSim: command line N: ...").
  void readStatus(const ZIN_CORE_REF& ref, ZIN_CORE_INFO& info, unsigned char* status,
                  uint32_t statusBytes, uint32_t statusBitCount) override;
  void commandSequence(const std::string& text, unsigned char* readData,
                       uint32_t readBitCount) override;
  void flush() override;
  bool listCores(std::vector<ZIN_CORE_REF>& refs) override;

  /// The description the target was built from (wiring changes made later are not in it).
  const TargetDescription& description() const { return description_; }

  // Inspection. The calls below that take a reference throw std::invalid_argument when no MOX
  // core is there. Level texts hold '0'/'1', character i for port bit i.
  std::string asyncOutputLevels(const ZIN_CORE_REF& ref) const;
  std::string syncOutputLevels(const ZIN_CORE_REF& ref) const;  // at the current cycle
  std::string asyncInputLevels(const ZIN_CORE_REF& ref) const;
  std::string syncInputLevels(const ZIN_CORE_REF& ref) const;  // the last clock samples
  uint64_t cycle(const ZIN_CORE_REF& ref) const;

  /// Rewires one input bit; the new level counts as a change for the activity latches. Throws
  /// std::invalid_argument for a bit or a source the core does not have.
  void setInputSource(const ZIN_CORE_REF& ref, InputPort port, uint32_t bit,
                      const InputSource& source);
  /// Advances the clock of every MOX core by `cycles` cycles.
  void advance(uint64_t cycles);
  /// Sets the cycles that pass with each command sequence, for every MOX core.
  void setCyclesPerSequence(uint32_t cycles);

  /// Bytes of text the command log keeps in all; a longer text keeps only its beginning.
  static constexpr size_t kCommandLogBytes = size_t{8} << 20;
  /// The texts of the latest command sequences received (rejected ones included), oldest first,
  /// at most kCommandLogBytes of them.
  std::vector<std::string> commandLog() const;
  void clearCommandLog();
  /// How many texts the log keeps (default 1000; the oldest are dropped).
  void setCommandLogLimit(size_t entries);
  uint64_t flushCount() const;

  /// The next command sequence throws `error` instead of taking effect.
  void failNextTransfer(std::exception_ptr error);
  /// The same with std::runtime_error(message).
  void failNextTransfer(const std::string& message);
  /// The next status read throws `error` and reports nothing.
  void failNextStatusRead(std::exception_ptr error);

 private:
  struct State;

  TargetDescription description_;
  mutable std::mutex mutex_;
  std::unique_ptr<State> state_;
};

}  // namespace ZinSim

#endif
