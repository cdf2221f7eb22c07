// Inputs of a simulated MOX core: their sources, the clock edges that sample them and the
// activity latches.
#include <algorithm>

#include "MoxModel.h"

namespace ZinSim {

namespace {

// Every pulse train has settled this many clock edges after its commit.
constexpr uint64_t kSettleEdges = MoxModel::kSteps + 1;

// Counters and square waves are periodic: level(t) = ((t + phase) mod period) >= high, rising
// where the phase reaches `high`, falling where it wraps to 0.
struct Periodic {
  uint64_t period;
  uint64_t phase;
  uint64_t high;
};

bool periodicOf(const InputSource& s, Periodic& p) {
  if (s.kind == InputSource::Kind::Counter) {
    p = {uint64_t{2} << s.bit, 0, uint64_t{1} << s.bit};
    return true;
  }
  if (s.kind == InputSource::Kind::Square) {
    p = {s.period, s.phase % s.period, s.period / 2};
    return true;
  }
  return false;
}

uint64_t phaseAt(const Periodic& p, uint64_t t) {
  return (t % p.period + p.phase) % p.period;
}

// Whether some cycle t in (from, from + cycles] has phase `target`.
bool reaches(const Periodic& p, uint64_t from, uint64_t cycles, uint64_t target) {
  const uint64_t first = (phaseAt(p, from) + 1) % p.period;  // phase of cycle from + 1
  const uint64_t distance = (target + p.period - first) % p.period;
  return distance < cycles;
}

}  // namespace

bool MoxModel::sourceLevel(const InputSource& s, uint64_t t) const {
  Periodic p{};
  switch (s.kind) {
    case InputSource::Kind::Constant:
      return s.value != 0;
    case InputSource::Kind::Loopback:
      return s.output == OutputPort::Async ? asyncOut_[s.bit] != 0 : syncOutputLevel(s.bit, t);
    default:
      periodicOf(s, p);
      return phaseAt(p, t) >= p.high;
  }
}

void MoxModel::observe(Input& input, bool level) {
  if (level == (input.level != 0)) return;
  (level ? input.up : input.down) = 1;
  input.level = level;
}

// Follows a change of the outputs or of the wiring within the current cycle.
void MoxModel::refreshLevels() {
  for (Input& in : asyncIn_) observe(in, sourceLevel(in.source, cycle_));
  for (Input& in : syncIn_) observe(in, sourceLevel(in.source, cycle_));
}

void MoxModel::clockEdge() {
  ++cycle_;
  if (clearPending_) {
    // The clear takes effect at this edge; what the edge itself changes is latched after it.
    for (Input& in : asyncIn_) in.up = in.down = 0;
    for (Input& in : syncIn_) in.up = in.down = in.syncUp = in.syncDown = 0;
    clearPending_ = false;
  }
  for (Input& in : asyncIn_) observe(in, sourceLevel(in.source, cycle_));
  for (Input& in : syncIn_) {
    observe(in, sourceLevel(in.source, cycle_));
    if (in.level != in.sample) (in.level ? in.syncUp : in.syncDown) = 1;
    in.sample = in.level;
  }
}

void MoxModel::skipPeriodic(Input& in, uint64_t from, uint64_t cycles, bool sampled) {
  Periodic p{};
  if (!periodicOf(in.source, p)) return;
  const bool rose = reaches(p, from, cycles, p.high);
  const bool fell = reaches(p, from, cycles, 0);
  in.up |= rose;
  in.down |= fell;
  in.level = phaseAt(p, from + cycles) >= p.high;
  if (!sampled) return;
  in.syncUp |= rose;
  in.syncDown |= fell;
  in.sample = in.level;
}

// Jumps over cycles in which only counters and square waves change: every other source is
// static once the pulse trains have settled and the synchronous inputs have sampled it.
void MoxModel::skipCycles(uint64_t cycles) {
  for (Input& in : asyncIn_) skipPeriodic(in, cycle_, cycles, false);
  for (Input& in : syncIn_) skipPeriodic(in, cycle_, cycles, true);
  cycle_ += cycles;
}

void MoxModel::advance(uint64_t cycles) {
  const uint64_t stepped = std::min(cycles, kSettleEdges);
  for (uint64_t i = 0; i < stepped; ++i) clockEdge();
  if (cycles > stepped) skipCycles(cycles - stepped);
}

void MoxModel::setInputSource(InputPort port, uint32_t bit, const InputSource& source) {
  Input& in = port == InputPort::Async ? asyncIn_.at(bit) : syncIn_.at(bit);
  in.source = source;
  observe(in, sourceLevel(source, cycle_));
}

// Default wiring: input i of each kind loops back output i of the same kind where that output
// exists, else reads 0. The description's rules then apply in order. The state starts as if
// the inputs had always had their level: no activity.
void MoxModel::applyWiring(const CoreDescription& description) {
  for (uint32_t i = 0; i < asyncIn_.size(); ++i) {
    if (i < asyncOutCount_) asyncIn_[i].source = InputSource::loopback(OutputPort::Async, i);
  }
  for (uint32_t i = 0; i < syncIn_.size(); ++i) {
    if (i < syncOutCount_) syncIn_[i].source = InputSource::loopback(OutputPort::Sync, i);
  }
  for (const WiringRule& rule : description.wiring) {
    std::vector<Input>& inputs = rule.port == InputPort::Async ? asyncIn_ : syncIn_;
    const bool stepsBit = rule.source.kind == InputSource::Kind::Loopback ||
                          rule.source.kind == InputSource::Kind::Counter;
    for (uint32_t k = 0; k < rule.count; ++k) {
      InputSource source = rule.source;
      if (stepsBit) source.bit += k;
      inputs.at(rule.first + k).source = source;
    }
  }
  for (std::vector<Input>* inputs : {&asyncIn_, &syncIn_}) {
    for (Input& in : *inputs) in.level = in.sample = sourceLevel(in.source, cycle_);
  }
}

}  // namespace ZinSim
