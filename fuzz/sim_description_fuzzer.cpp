// JSON target descriptions of any bytes. parseDescription either gives a description or throws
// DescriptionError; a description it gives passes findProblem, builds a target (when small
// enough to simulate quickly), and reads back unchanged from its own JSON text.
#include <cstddef>
#include <cstdint>
#include <exception>
#include <string>
#include <string_view>

#include "FuzzSession.h"
#include "ZinSim/Description.h"
#include "ZinSim/Target.h"

using namespace ZinFuzz;

namespace {

// Port bits of all cores together; above this the fuzzer does not build the target, only to
// keep each input fast.
constexpr uint64_t kMaxSimulatedBits = 1 << 16;

uint64_t portBits(const ZinSim::TargetDescription& description) {
  uint64_t bits = 0;
  for (const auto& core : description.cores) {
    bits += uint64_t{core.asyncInputs} + core.syncInputs + core.asyncOutputs + core.syncOutputs;
  }
  return bits;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  ZinSim::TargetDescription description;
  try {
    description = ZinSim::parseDescription(text);
  } catch (const ZinSim::DescriptionError&) {
    return 0;
  } catch (const std::exception& error) {
    fail(std::string("parseDescription threw another exception: ") + error.what());
  }
  if (const auto problem = ZinSim::findProblem(description)) {
    fail("parseDescription accepted a description with a problem: " + problem->place + ": " +
         problem->text);
  }
  const std::string json = ZinSim::descriptionToJson(description);
  try {
    const std::string again = ZinSim::descriptionToJson(ZinSim::parseDescription(json));
    if (again != json) fail("the description's JSON text does not read back unchanged:\n" + json);
  } catch (const std::exception& error) {
    fail(std::string("the description's own JSON text is rejected: ") + error.what() + "\n" + json);
  }
  if (portBits(description) <= kMaxSimulatedBits) {
    try {
      ZinSim::Target target(description);
    } catch (const std::exception& error) {
      fail(std::string("a parsed description does not build a target: ") + error.what());
    }
  }
  return 0;
}
