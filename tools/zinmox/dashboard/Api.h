// The dashboard's JSON API: the cores of the target, names, writes, live settings, the
// waveform download and the event stream of reads.
//
//   GET  /api/target                   the target, its cores, the live settings and the limits
//   GET  /api/cores/REF                a core's information, names and last written outputs
//   POST /api/cores/REF/define         {"name", "port", "bits"}   bits: "0-7" or [0, 1, ...]
//   POST /api/cores/REF/undefine       {"name", "port"}
//   POST /api/cores/REF/write          {"values": {"NAME": "HEX", "NAME.pulsetrain": "HEX"}}
//   POST /api/live                     {"core", "rate_hz", "paused"}, each optional
//   GET  /api/waveform.vcd             the kept reads as a value-change dump
//   GET  /api/events                   server-sent events, one per change (Server.cpp)
//
// Errors are {"error": TEXT} with a 4xx status (5xx only when the target itself fails).
#ifndef ZINMOX_DASHBOARD_API_H
#define ZINMOX_DASHBOARD_API_H

#include <httplib.h>

#include <nlohmann/json.hpp>

#include "HostLink.h"
#include "ReadHub.h"

namespace zinmox::dashboard {

/// The largest request body, in bytes.
inline constexpr size_t kMaxBodyBytes = 16 * 1024;
/// Pages that may hold an event stream at once, and reads per event at most.
inline constexpr size_t kMaxLiveViews = 8;
inline constexpr size_t kMaxSamplesPerEvent = 200;

/// Adds the JSON routes above to `server`.
void addApiRoutes(httplib::Server& server, HostLink& host, ReadHub& hub);

/// The event a page receives: the live settings, the host's version, the last read error and
/// the new reads.
nlohmann::json stateJson(const HubState& state, uint64_t hostVersion);

/// stateJson as one server-sent event.
std::string eventText(const HubState& state, uint64_t hostVersion);

/// Sets `res` to {"error": text} with `status`.
void setError(httplib::Response& res, int status, const std::string& text);

}  // namespace zinmox::dashboard

#endif
