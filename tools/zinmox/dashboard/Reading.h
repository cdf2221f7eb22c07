// One named input as a read reports it, shared by the dashboard's reader, its waveform files
// and `watch --vcd`.
#ifndef ZINMOX_DASHBOARD_READING_H
#define ZINMOX_DASHBOARD_READING_H

#include <cstdint>
#include <string>

namespace zinmox::dashboard {

/// The library's hex texts of one input: its value and activity (sync activity: synchronous
/// inputs only).
struct Reading {
  std::string name;
  uint32_t width = 0;
  bool sync = false;
  std::string value, activityUp, activityDown, syncActivityUp, syncActivityDown;
};

}  // namespace zinmox::dashboard

#endif
