// Checks of one core description, shared by the JSON reader and descriptions built in code.
#ifndef ZINSIM_DESCRIPTIONCHECK_H
#define ZINSIM_DESCRIPTIONCHECK_H

#include <optional>

#include "ZinSim/Description.h"

namespace ZinSim {

/// Largest counter bit a source may name.
inline constexpr uint32_t kMaxCounterBit = 62;
/// Largest square-wave period (so that every phase arithmetic stays in 64 bits).
inline constexpr uint64_t kMaxSquarePeriod = uint64_t{1} << 62;
// Arrays and objects nested in a description text, at most.
inline constexpr int kMaxDescriptionDepth = 32;

/// The first problem of one core, with its place relative to the core ("async_inputs",
/// "wiring/1/source/bit"), or nothing.
std::optional<DescriptionProblem> checkCore(const CoreDescription& core);

/// The largest port count that the status layout of this version can carry.
uint32_t maxPortCount(uint32_t majorVersion, uint32_t minorVersion);

}  // namespace ZinSim

#endif
