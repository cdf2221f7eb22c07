// The JSON object of one input reading, shared by `read --json` and the dashboard's API.
#ifndef ZINHOST_READINGJSON_H
#define ZINHOST_READINGJSON_H

#include <nlohmann/json.hpp>

#include "ZinHost/Report.h"

namespace ZinHost {

/// {"name", "width", "value", "activity_up", "activity_down"} and, for a synchronous input,
/// "sync_activity_up" and "sync_activity_down".
nlohmann::json readingJson(const InputReading& input);

}  // namespace ZinHost

#endif
