// The framework's list of registered cores.
#ifndef ZINRT_ZIN_CORELIST_H
#define ZINRT_ZIN_CORELIST_H

#include <cstdint>

#include "ZinRT/Zin_Core.h"

namespace ZinRT {

/// Registered cores, keyed by session handle and core reference. Safe to call from several
/// threads. The list owns what is added and destroys it through the virtual destructor; the
/// cores of a session are destroyed when the session is closed.
class ZINCORE_API Zin_CoreList {
 public:
  /// The core registered at (handle, ref), or null.
  static Zin_Core* getCore(uint32_t handle, ZIN_CORE_REF ref);
  /// Registers `core` under (handle, core->getCoreRef()); a core registered there before is
  /// destroyed. Adding a core again at its own place changes nothing. Throws
  /// std::invalid_argument for a null core or a core already registered at another place.
  static void addCore(uint32_t handle, Zin_Core* core);
  /// Unregisters and destroys *core if it is registered on the session, and sets *core to null.
  /// A core that is not registered is left alone (it is not even dereferenced); a null `core`
  /// throws std::invalid_argument.
  static void removeCore(uint32_t handle, Zin_Core** core);
  /// Destroys every core of a session.
  static void removeSessionCores(uint32_t handle);
  /// Number of cores registered on a session.
  static uint32_t coreCount(uint32_t handle);
};

}  // namespace ZinRT

#endif
