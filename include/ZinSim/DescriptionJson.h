// Reading a target description from an nlohmann::json value (needs nlohmann-json's headers).
#ifndef ZINSIM_DESCRIPTIONJSON_H
#define ZINSIM_DESCRIPTIONJSON_H

#include <nlohmann/json.hpp>

#include "ZinSim/Description.h"

namespace ZinSim {

/// The same as parseDescription on the value's JSON text. Throws DescriptionError.
inline TargetDescription descriptionFromJson(const nlohmann::json& value) {
  return parseDescription(value.dump());
}

}  // namespace ZinSim

#endif
