// Opening the target of a --target option.
#include "TargetOpen.h"

#include "Errors.h"
#include "ZinSim/Description.h"
#include "ZinSim/Target.h"

namespace zinmox {

std::shared_ptr<ZinRT::Zin_Transport> openTarget(const std::string& spec) {
  if (spec.empty()) return std::make_shared<ZinSim::Target>();
  try {
    return std::make_shared<ZinSim::Target>(ZinSim::loadDescription(spec));
  } catch (const ZinSim::DescriptionError& error) {
    throw Failure("cannot use the target file " + spec + ": " + error.what());
  }
}

std::string describeTarget(const std::string& spec) {
  return spec.empty() ? "the built-in demo design" : spec;
}

}  // namespace zinmox
