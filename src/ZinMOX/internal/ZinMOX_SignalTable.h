// The table type in which a MOX core keeps its named signals.
#ifndef ZINMOX_SIGNALTABLE_H
#define ZINMOX_SIGNALTABLE_H

#include <cstddef>
#include <string_view>
#include <unordered_map>

namespace ZinRT {

class ZinMOX_SignalGroup;

/// Hash and equality on names that ignore the case of ASCII letters.
inline char zinmoxFoldCase(char c) noexcept {
  return (c >= 'A' && c <= 'Z') ? static_cast<char>(c - 'A' + 'a') : c;
}
struct ZinMOX_NameHash {
  std::size_t operator()(std::string_view name) const noexcept {
    std::size_t hash = 14695981039346656037ull;  // FNV-1a over the case-folded bytes
    for (char c : name) {
      hash = (hash ^ static_cast<unsigned char>(zinmoxFoldCase(c))) * 1099511628211ull;
    }
    return hash;
  }
};
struct ZinMOX_NameEqual {
  bool operator()(std::string_view a, std::string_view b) const noexcept {
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
      if (zinmoxFoldCase(a[i]) != zinmoxFoldCase(b[i])) return false;
    }
    return true;
  }
};

/// Name to group. A key views the characters of its group's own key name, so it lives exactly as
/// long as the group; the table owns its groups.
using ZinMOX_SignalTable =
    std::unordered_map<std::string_view, ZinMOX_SignalGroup*, ZinMOX_NameHash, ZinMOX_NameEqual>;

/// The group named `name` in any case, or null.
ZinMOX_SignalGroup* findSignal(const ZinMOX_SignalTable& table, std::string_view name);
/// The group named `name` in any case; fails with "Could not find a signal with the name: "
/// followed by the name otherwise.
ZinMOX_SignalGroup* requireSignal(const ZinMOX_SignalTable& table, std::string_view name);

}  // namespace ZinRT

#endif
