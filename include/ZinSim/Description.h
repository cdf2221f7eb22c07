// What a simulated target holds: its cores, their versions, port widths, input wiring and clock.
#ifndef ZINSIM_DESCRIPTION_H
#define ZINSIM_DESCRIPTION_H

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "ZinRT/ZinCore_Types.h"
#include "ZinSim/ZinSim_Export.h"

namespace ZinSim {

/// Core type of a MOX core.
inline constexpr uint32_t kMoxCoreType = 9;

enum class OutputPort { Async, Sync };
enum class InputPort { Async, Sync };

/// Where the level of one input bit comes from.
struct ZINSIM_API InputSource {
  enum class Kind {
    Constant,  // always `value`
    Loopback,  // the level of output bit `bit` of port `output`
    Counter,   // bit `bit` (0 to 62) of the core's free-running cycle counter
    Square     // low for period/2 cycles, then high; cycle t is at (t + phase) mod period
  };
  Kind kind = Kind::Constant;
  uint32_t value = 0;
  OutputPort output = OutputPort::Async;
  uint32_t bit = 0;
  uint64_t period = 2;
  uint64_t phase = 0;

  static InputSource constant(bool level);
  static InputSource loopback(OutputPort port, uint32_t bit);
  static InputSource counter(uint32_t bit);
  static InputSource square(uint64_t period, uint64_t phase = 0);
};

/// Wires `count` input bits from `first` on. For loopback and counter sources the source bit
/// grows with the input bit: input first + k takes source bit `source.bit` + k.
struct ZINSIM_API WiringRule {
  InputPort port = InputPort::Async;
  uint32_t first = 0;
  uint32_t count = 1;
  InputSource source;
};

/// One core of the target. For MOX cores (type 9) the status word is built from the version,
/// the widths and the qx version; other cores answer `status` (bit i in bit i mod 8 of byte i/8).
struct ZINSIM_API CoreDescription {
  ZIN_CORE_REF ref{0, 0, 0};
  std::string name;
  uint32_t manufacturerId = 0x0A5;
  uint32_t type = kMoxCoreType;
  uint32_t majorVersion = 10;
  uint32_t minorVersion = 0;
  uint32_t revision = 0;
  uint32_t qxMajorVersion = 0;  // full layout (version 10.0 and later) only
  uint32_t qxMinorVersion = 0;
  uint32_t qxMinorVersionAlpha = 0;
  uint32_t asyncInputs = 0;
  uint32_t syncInputs = 0;
  uint32_t asyncOutputs = 0;
  uint32_t syncOutputs = 0;
  uint32_t cyclesPerSequence = 1;     // clock cycles that pass with each command sequence
  std::vector<WiringRule> wiring;     // applied in order over the default wiring
  std::vector<unsigned char> status;  // other core types: at most 16 bytes
};

struct ZINSIM_API TargetDescription {
  std::string name;
  std::vector<CoreDescription> cores;
};

/// A description that cannot be used. `pointer()` is the JSON pointer of the offending place
/// ("" for the document as a whole); `what()` is "<pointer>: <what is wrong>".
class ZINSIM_API DescriptionError : public std::runtime_error {
 public:
  DescriptionError(const std::string& pointer, const std::string& problem);
  const std::string& pointer() const noexcept { return pointer_; }
  const std::string& problem() const noexcept { return problem_; }

 private:
  std::string pointer_;
  std::string problem_;
};

/// Reads a description from JSON text (format: docs/target.md). Throws DescriptionError.
ZINSIM_API TargetDescription parseDescription(std::string_view jsonText);

/// Reads a description from a JSON file. Throws DescriptionError (also when the file cannot be
/// read).
ZINSIM_API TargetDescription loadDescription(const std::string& path);

/// The JSON text of a description, in the format parseDescription reads (cores grouped by device
/// and user chain, in reference order). `indent` < 0 gives a single line.
ZINSIM_API std::string descriptionToJson(const TargetDescription& description, int indent = 2);

/// The built-in demo design, as a description and as its JSON text.
ZINSIM_API TargetDescription demoDescription();
ZINSIM_API const std::string& demoDescriptionJson();

/// Checks a description built in code: returns the first problem as (place, text), where place
/// is a JSON-pointer-like path below the target ("/cores/2/async_inputs"), or nothing.
struct DescriptionProblem {
  std::string place;
  std::string text;
};
ZINSIM_API std::optional<DescriptionProblem> findProblem(const TargetDescription& description);

/// "device 01 chain 2 core 0": how the simulator names a core reference in messages.
ZINSIM_API std::string refText(const ZIN_CORE_REF& ref);

}  // namespace ZinSim

#endif
