// Outputs, staging and the read-out layout of a simulated MOX core.
#include "MoxModel.h"

#include <algorithm>
#include <cstring>

namespace ZinSim {

namespace {

// Bit `index` of a little-endian number held in bytes.
inline bool numberBit(const std::vector<uint8_t>& number, uint64_t index) {
  return ((number[index / 8] >> (index % 8)) & 1u) != 0;
}

inline void setNumberBit(unsigned char* number, uint64_t index) {
  number[index / 8] = static_cast<unsigned char>(number[index / 8] | (1u << (index % 8)));
}

std::string levels(const std::vector<uint8_t>& bits) {
  std::string text(bits.size(), '0');
  for (size_t i = 0; i < bits.size(); ++i) text[i] = bits[i] ? '1' : '0';
  return text;
}

}  // namespace

MoxModel::MoxModel(const CoreDescription& description)
    : asyncOutCount_(description.asyncOutputs),
      syncOutCount_(description.syncOutputs),
      cyclesPerSequence_(description.cyclesPerSequence),
      stagedAsyncValue_(asyncOutCount_, 0),
      stagedAsyncUpdate_(asyncOutCount_, 0),
      stagedTrain_(syncOutCount_, 0),
      stagedSyncUpdate_(syncOutCount_, 0),
      asyncOut_(asyncOutCount_, 0),
      train_(syncOutCount_, 0),
      commitCycle_(syncOutCount_, 0),
      levelBefore_(syncOutCount_, 0),
      asyncIn_(description.asyncInputs),
      syncIn_(description.syncInputs) {
  applyWiring(description);
}

uint32_t MoxModel::writeLength() const {
  return 2 * asyncOutCount_ + 17 * syncOutCount_ + 1;
}

uint32_t MoxModel::readLength() const {
  return static_cast<uint32_t>(4 * asyncIn_.size() + 6 * syncIn_.size() + 16);
}

uint64_t MoxModel::portBits() const {
  return uint64_t{asyncOutCount_} + syncOutCount_ + asyncIn_.size() + syncIn_.size();
}

uint32_t MoxModel::width(InputPort port) const {
  return static_cast<uint32_t>(port == InputPort::Async ? asyncIn_.size() : syncIn_.size());
}

uint32_t MoxModel::width(OutputPort port) const {
  return port == OutputPort::Async ? asyncOutCount_ : syncOutCount_;
}

// The data is D = async values, step strings, async update characters, sync update
// characters, with D[0] the most significant bit of the number.
void MoxModel::stage(const std::vector<uint8_t>& number) {
  const uint64_t a = asyncOutCount_;
  const uint64_t s = syncOutCount_;
  const uint64_t top = writeLength() - 2;  // number bit of D[0]
  stagedSinceCommit_ = true;
  for (uint64_t i = 0; i < a; ++i) {
    stagedAsyncValue_[i] = numberBit(number, top - i);
    stagedAsyncUpdate_[i] = numberBit(number, top - (a + kSteps * s + i));
  }
  for (uint64_t k = 0; k < s; ++k) {
    uint16_t train = 0;
    for (uint64_t t = 0; t < kSteps; ++t) {
      if (numberBit(number, top - (a + kSteps * k + t)))
        train = static_cast<uint16_t>(train | (1u << t));
    }
    stagedTrain_[k] = train;
    stagedSyncUpdate_[k] = numberBit(number, top - (2 * a + kSteps * s + k));
  }
}

void MoxModel::commit() {
  if (!stagedSinceCommit_ && lastCommitCycle_ == cycle_) return;
  stagedSinceCommit_ = false;
  lastCommitCycle_ = cycle_;
  for (uint32_t i = 0; i < asyncOutCount_; ++i) {
    if (stagedAsyncUpdate_[i]) asyncOut_[i] = stagedAsyncValue_[i];
  }
  for (uint32_t k = 0; k < syncOutCount_; ++k) {
    if (!stagedSyncUpdate_[k]) continue;
    levelBefore_[k] = syncOutputLevel(k, cycle_);
    commitCycle_[k] = cycle_;
    train_[k] = stagedTrain_[k];
  }
  refreshLevels();
}

bool MoxModel::syncOutputLevel(uint32_t bit, uint64_t t) const {
  const uint64_t committed = commitCycle_[bit];
  if (t <= committed) return levelBefore_[bit] != 0;
  const uint64_t step = std::min<uint64_t>(t - committed - 1, kSteps - 1);
  return ((train_[bit] >> step) & 1u) != 0;
}

// B[4i..4i+3] = async input i: value, up, down, 0; then B[4A + 6i ..] = sync input i: value, up,
// down, sync up, sync down, 0. B[j] is bit N-1-j of the number; the 16 bits above are 0.
void MoxModel::capture(unsigned char* out) const {
  const uint64_t n = 4 * asyncIn_.size() + 6 * syncIn_.size();
  std::memset(out, 0, (readLength() + 7) / 8);
  auto put = [&](uint64_t j, uint8_t bit) {
    if (bit) setNumberBit(out, n - 1 - j);
  };
  for (uint64_t i = 0; i < asyncIn_.size(); ++i) {
    const Input& in = asyncIn_[i];
    put(4 * i, in.level);
    put(4 * i + 1, in.up);
    put(4 * i + 2, in.down);
  }
  const uint64_t base = 4 * asyncIn_.size();
  for (uint64_t i = 0; i < syncIn_.size(); ++i) {
    const Input& in = syncIn_[i];
    put(base + 6 * i, in.sample);
    put(base + 6 * i + 1, in.up);
    put(base + 6 * i + 2, in.down);
    put(base + 6 * i + 3, in.syncUp);
    put(base + 6 * i + 4, in.syncDown);
  }
}

void MoxModel::requestClear() {
  clearPending_ = true;
}

void MoxModel::endSequence() {
  if (cyclesPerSequence_ != 0) {
    advance(cyclesPerSequence_);
    return;
  }
  if (clearPending_) {
    for (Input& in : asyncIn_) in.up = in.down = 0;
    for (Input& in : syncIn_) in.up = in.down = in.syncUp = in.syncDown = 0;
    clearPending_ = false;
  }
}

std::string MoxModel::asyncOutputLevels() const {
  return levels(asyncOut_);
}

std::string MoxModel::syncOutputLevels() const {
  std::string text(syncOutCount_, '0');
  for (uint32_t k = 0; k < syncOutCount_; ++k) text[k] = syncOutputLevel(k, cycle_) ? '1' : '0';
  return text;
}

std::string MoxModel::asyncInputLevels() const {
  std::string text(asyncIn_.size(), '0');
  for (size_t i = 0; i < asyncIn_.size(); ++i) text[i] = asyncIn_[i].level ? '1' : '0';
  return text;
}

std::string MoxModel::syncInputLevels() const {
  std::string text(syncIn_.size(), '0');
  for (size_t i = 0; i < syncIn_.size(); ++i) text[i] = syncIn_[i].sample ? '1' : '0';
  return text;
}

}  // namespace ZinSim
