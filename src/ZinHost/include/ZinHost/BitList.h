// Bit lists: the port bits of a signal, value bit i first, as users write them ("0-7", "7-0",
// "3", "0,2,4", "8-11,0").
#ifndef ZINHOST_BITLIST_H
#define ZINHOST_BITLIST_H

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace ZinHost {

/// The largest bit number a list may hold: a port is at most 65535 bits wide.
inline constexpr uint32_t kMaxBitNumber = 65534;
/// The most bits a list may hold when the port's width is not known.
inline constexpr uint32_t kMaxListBits = kMaxBitNumber + 1;

/// Parses a bit list of at most `maxBits` bits (the width of the port it is for). A range is
/// counted before it is expanded, so a list never takes more memory than the port. Throws
/// TextError for a malformed list, a bit above kMaxBitNumber, a bit listed twice, or more bits
/// than `maxBits`.
std::vector<uint32_t> parseBitList(std::string_view text, uint32_t maxBits = kMaxListBits);

/// The same checks for a list given as numbers: no bit above kMaxBitNumber, none listed twice,
/// at most `maxBits`. Throws TextError.
void checkBitList(const std::vector<uint32_t>& bits, uint32_t maxBits = kMaxListBits);

/// "0-7", "3", "0,2,4": the shortest text that parseBitList reads back as `bits`; a long list
/// is cut after about 60 characters and ends in ",...".
std::string formatBitList(const std::vector<uint32_t>& bits);

}  // namespace ZinHost

#endif
