// Value-change dumps of input reads: each input with its activity flags as separate signals, so
// that a waveform viewer shows what a series of reads saw.
#ifndef ZINMOX_DASHBOARD_VCD_H
#define ZINMOX_DASHBOARD_VCD_H

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

#include "Reading.h"

namespace zinmox::dashboard {

class VcdWriter {
 public:
  /// Writes the header: one scope named `scope` with, for every input of `inputs`, the signals
  /// NAME, NAME_activity_up and NAME_activity_down (and NAME_sync_activity_up/_down for
  /// synchronous inputs), with the inputs' widths. Time is in microseconds.
  VcdWriter(std::ostream& out, const std::string& scope, const std::vector<Reading>& inputs);

  /// Writes the values of one read taken `timeUs` after the start; the first read dumps every
  /// signal, later ones only the signals that changed. `inputs` must have the header's shape
  /// (same names in the same order); a time not after the previous one is moved just past it.
  void sample(uint64_t timeUs, const std::vector<Reading>& inputs);

 private:
  struct Signal {
    std::string code;
    uint32_t width;
    std::string last;  // the last bits written
  };

  std::ostream& out_;
  std::vector<Signal> signals_;
  std::vector<std::string> names_;  // the inputs, to check the shape of later reads
  bool started_ = false;
  uint64_t lastTime_ = 0;
};

/// A scope or signal name as a viewer accepts it: letters, digits and '_' only.
std::string vcdName(const std::string& text);

/// The low `width` bits of a hex text, most significant first; a character that is not a hex
/// digit gives 'x' bits.
std::string hexToBits(const std::string& hex, uint32_t width);

}  // namespace zinmox::dashboard

#endif
