// Building blocks of target descriptions and the checks every description passes.
#include "ZinSim/Description.h"

#include <cstdio>
#include <set>
#include <tuple>

#include "DescriptionCheck.h"

namespace ZinSim {

InputSource InputSource::constant(bool level) {
  InputSource s;
  s.kind = Kind::Constant;
  s.value = level ? 1 : 0;
  return s;
}

InputSource InputSource::loopback(OutputPort port, uint32_t bit) {
  InputSource s;
  s.kind = Kind::Loopback;
  s.output = port;
  s.bit = bit;
  return s;
}

InputSource InputSource::counter(uint32_t bit) {
  InputSource s;
  s.kind = Kind::Counter;
  s.bit = bit;
  return s;
}

InputSource InputSource::square(uint64_t period, uint64_t phase) {
  InputSource s;
  s.kind = Kind::Square;
  s.period = period;
  s.phase = phase;
  return s;
}

DescriptionError::DescriptionError(const std::string& pointer, const std::string& problem)
    : std::runtime_error((pointer.empty() ? std::string("(description)") : pointer) + ": " +
                         problem),
      pointer_(pointer),
      problem_(problem) {}

std::string refText(const ZIN_CORE_REF& ref) {
  char text[64];
  std::snprintf(text, sizeof text, "device %02X chain %X core %X", ref.deviceIndex,
                ref.userChainNumber, ref.coreIndex);
  return text;
}

uint32_t maxPortCount(uint32_t majorVersion, uint32_t minorVersion) {
  const uint32_t key = (majorVersion << 4) | minorVersion;
  return key < 0x62 ? 255u : 65535u;
}

namespace {

using Problem = std::optional<DescriptionProblem>;

Problem problem(std::string place, std::string text) {
  return DescriptionProblem{std::move(place), std::move(text)};
}

uint32_t portWidth(const CoreDescription& core, OutputPort port) {
  return port == OutputPort::Async ? core.asyncOutputs : core.syncOutputs;
}

Problem checkSource(const CoreDescription& core, const WiringRule& rule, const std::string& at) {
  const InputSource& s = rule.source;
  const uint64_t lastBit = uint64_t{s.bit} + rule.count - 1;
  switch (s.kind) {
    case InputSource::Kind::Constant:
      if (s.value > 1) return problem(at + "/value", "expected 0 or 1");
      return std::nullopt;
    case InputSource::Kind::Loopback: {
      const uint32_t width = portWidth(core, s.output);
      const char* name = s.output == OutputPort::Async ? "async_outputs" : "sync_outputs";
      if (lastBit >= width) {
        return problem(at + "/bit", "output bits " + std::to_string(s.bit) + " to " +
                                        std::to_string(lastBit) + " are not all below " + name +
                                        " (" + std::to_string(width) + ")");
      }
      return std::nullopt;
    }
    case InputSource::Kind::Counter:
      if (lastBit > kMaxCounterBit) {
        return problem(at + "/bit", "counter bits " + std::to_string(s.bit) + " to " +
                                        std::to_string(lastBit) + " are not all in 0 to " +
                                        std::to_string(kMaxCounterBit));
      }
      return std::nullopt;
    case InputSource::Kind::Square:
      if (s.period < 2 || s.period > kMaxSquarePeriod) {
        return problem(at + "/period", "expected a period from 2 to 2^62 cycles");
      }
      return std::nullopt;
  }
  return problem(at + "/kind", "unknown source kind");
}

Problem checkWiring(const CoreDescription& core) {
  for (size_t i = 0; i < core.wiring.size(); ++i) {
    const WiringRule& rule = core.wiring[i];
    const std::string at = "wiring/" + std::to_string(i);
    const uint32_t width = rule.port == InputPort::Async ? core.asyncInputs : core.syncInputs;
    const char* name = rule.port == InputPort::Async ? "async_inputs" : "sync_inputs";
    if (rule.count == 0) return problem(at + "/count", "expected at least 1");
    if (uint64_t{rule.first} + rule.count > width) {
      return problem(at + "/count", "input bits " + std::to_string(rule.first) + " to " +
                                        std::to_string(uint64_t{rule.first} + rule.count - 1) +
                                        " are not all below " + name + " (" +
                                        std::to_string(width) + ")");
    }
    if (Problem p = checkSource(core, rule, at + "/source")) return p;
  }
  return std::nullopt;
}

Problem checkMoxCore(const CoreDescription& core) {
  const uint32_t key = (core.majorVersion << 4) | core.minorVersion;
  const uint32_t most = maxPortCount(core.majorVersion, core.minorVersion);
  const std::pair<const char*, uint32_t> widths[] = {{"async_inputs", core.asyncInputs},
                                                     {"sync_inputs", core.syncInputs},
                                                     {"async_outputs", core.asyncOutputs},
                                                     {"sync_outputs", core.syncOutputs}};
  for (const auto& [name, width] : widths) {
    if (width > most) {
      return problem(name, std::to_string(width) + " does not fit the status word of version " +
                               std::to_string(core.majorVersion) + "." +
                               std::to_string(core.minorVersion) + " (at most " +
                               std::to_string(most) + ")");
    }
  }
  const bool qxSet =
      core.qxMajorVersion != 0 || core.qxMinorVersion != 0 || core.qxMinorVersionAlpha != 0;
  if (qxSet && key < 0xA0) return problem("qx_version", "needs core version 10.0 or later");
  if (core.qxMajorVersion > 15) return problem("qx_version/major", "expected 0 to 15");
  if (core.qxMinorVersion > 255) return problem("qx_version/minor", "expected 0 to 255");
  if (core.qxMinorVersionAlpha > 255) return problem("qx_version/alpha", "expected 0 to 255");
  if (!core.status.empty())
    return problem("status", "a MOX core's status word is built from its widths");
  return checkWiring(core);
}

}  // namespace

std::optional<DescriptionProblem> checkCore(const CoreDescription& core) {
  if (core.ref.deviceIndex > 255) return problem("index", "device index above 255");
  if (core.ref.userChainNumber > 15) return problem("number", "user chain number above 15");
  if (core.ref.coreIndex > 15) return problem("index", "core index above 15");
  if (core.majorVersion > 255) return problem("major_version", "expected 0 to 255");
  if (core.minorVersion > 255) return problem("minor_version", "expected 0 to 255");
  if (core.type == kMoxCoreType) return checkMoxCore(core);
  if (core.status.size() > 16) return problem("status", "at most 16 status bytes (128 bits)");
  if (core.asyncInputs || core.syncInputs || core.asyncOutputs || core.syncOutputs ||
      !core.wiring.empty()) {
    return problem("type", "only MOX cores (type 9) have ports");
  }
  return std::nullopt;
}

std::optional<DescriptionProblem> findProblem(const TargetDescription& description) {
  std::set<std::tuple<uint32_t, uint32_t, uint32_t>> seen;
  for (size_t i = 0; i < description.cores.size(); ++i) {
    const CoreDescription& core = description.cores[i];
    const std::string at = "/cores/" + std::to_string(i);
    if (auto p = checkCore(core)) return problem(at + "/" + p->place, p->text);
    const auto key =
        std::make_tuple(core.ref.deviceIndex, core.ref.userChainNumber, core.ref.coreIndex);
    if (!seen.insert(key).second) return problem(at, refText(core.ref) + " is described twice");
  }
  return std::nullopt;
}

}  // namespace ZinSim
