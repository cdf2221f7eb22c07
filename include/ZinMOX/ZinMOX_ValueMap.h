// The value map of the named-value calls.
#ifndef ZINMOX_VALUEMAP_H
#define ZINMOX_VALUEMAP_H

#include <string>
#include <unordered_map>

namespace ZinRT {

/// Signal name (optionally with a key suffix) to hexadecimal text, most significant digit first.
/// The exported functions take a pointer to a uintptr_t word that holds the map's address.
using ZinMOX_ValueMap = std::unordered_map<std::string, std::string>;

}  // namespace ZinRT

#endif
