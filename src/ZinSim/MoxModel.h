// The behaviour of one simulated MOX core: staged and committed outputs, pulse trains on the
// core's clock, input sources, activity latches and the read-out layout.
#ifndef ZINSIM_MOXMODEL_H
#define ZINSIM_MOXMODEL_H

#include <cstdint>
#include <string>
#include <vector>

#include "ZinSim/Description.h"

namespace ZinSim {

class MoxModel {
 public:
  static constexpr uint32_t kSteps = 16;

  explicit MoxModel(const CoreDescription& description);

  /// Bit lengths of the command lines this core accepts.
  uint32_t writeLength() const;  // code 01: 2*A_out + 17*S_out + 1
  uint32_t readLength() const;   // code 03: 4*A_in + 6*S_in + 16
  /// A_out + S_out + A_in + S_in: the most that a commit visits.
  uint64_t portBits() const;

  /// Code 01: `number` holds the line's data as a little-endian number of writeLength()-1 bits.
  void stage(const std::vector<uint8_t>& number);
  /// Code 02: applies the staged image to the bits whose update character is '1'. Committing the
  /// same image again within the same cycle changes nothing, so it is skipped.
  void commit();
  /// Code 03: writes the input image, ceil(readLength()/8) bytes, little-endian.
  void capture(unsigned char* out) const;
  /// Code 04: clears the activity latches at the next clock edge of this sequence (at once if
  /// the sequence does not advance the clock); a change seen at that edge stays latched.
  void requestClear();
  /// Closes a command sequence: the clock advances by cyclesPerSequence cycles.
  void endSequence();
  /// Advances the core's clock by `cycles` cycles.
  void advance(uint64_t cycles);

  void setInputSource(InputPort port, uint32_t bit, const InputSource& source);
  void setCyclesPerSequence(uint32_t cycles) { cyclesPerSequence_ = cycles; }

  uint64_t cycle() const { return cycle_; }
  uint32_t width(InputPort port) const;
  uint32_t width(OutputPort port) const;
  std::string asyncOutputLevels() const;
  std::string syncOutputLevels() const;  // at the current cycle
  std::string asyncInputLevels() const;
  std::string syncInputLevels() const;  // the clock samples

 private:
  struct Input {
    InputSource source;
    uint8_t level = 0;   // current level of the source
    uint8_t sample = 0;  // synchronous inputs: level at the last clock edge
    uint8_t up = 0;
    uint8_t down = 0;
    uint8_t syncUp = 0;
    uint8_t syncDown = 0;
  };

  bool syncOutputLevel(uint32_t bit, uint64_t t) const;
  bool sourceLevel(const InputSource& source, uint64_t t) const;
  static void observe(Input& input, bool level);
  void refreshLevels();
  void clockEdge();
  void skipCycles(uint64_t cycles);
  static void skipPeriodic(Input& input, uint64_t from, uint64_t cycles, bool sampled);
  void applyWiring(const CoreDescription& description);

  uint32_t asyncOutCount_;
  uint32_t syncOutCount_;
  uint32_t cyclesPerSequence_;
  uint64_t cycle_ = 0;
  bool clearPending_ = false;
  bool stagedSinceCommit_ = true;
  uint64_t lastCommitCycle_ = 0;

  // Staged by code 01.
  std::vector<uint8_t> stagedAsyncValue_;
  std::vector<uint8_t> stagedAsyncUpdate_;
  std::vector<uint16_t> stagedTrain_;  // bit t = step t
  std::vector<uint8_t> stagedSyncUpdate_;

  // Committed outputs.
  std::vector<uint8_t> asyncOut_;
  std::vector<uint16_t> train_;
  std::vector<uint64_t> commitCycle_;  // step 0 plays in cycle commitCycle_ + 1
  std::vector<uint8_t> levelBefore_;   // level up to and including the commit cycle

  std::vector<Input> asyncIn_;
  std::vector<Input> syncIn_;
};

}  // namespace ZinSim

#endif
