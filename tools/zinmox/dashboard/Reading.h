// One named input as a read reports it, shared by the dashboard's reader, its waveform files
// and `watch --vcd`.
#ifndef ZINMOX_DASHBOARD_READING_H
#define ZINMOX_DASHBOARD_READING_H

#include "ZinHost/Report.h"

namespace zinmox::dashboard {

/// The library's hex texts of one input: its value and activity (sync activity: synchronous
/// inputs only).
using Reading = ZinHost::InputReading;

}  // namespace zinmox::dashboard

#endif
