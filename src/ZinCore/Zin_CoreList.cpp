// The registered cores of all sessions. Cores are destroyed outside the list's mutex, so that a
// core's destructor may itself use the list or its session.
#include "ZinRT/Zin_CoreList.h"

#include <map>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <tuple>
#include <vector>

#include "ZinRT/ZinJtag.h"

namespace ZinRT {

namespace {

using Key = std::tuple<uint32_t, uint32_t, uint32_t, uint32_t>;  // handle, device, chain, core

Key keyOf(uint32_t handle, const ZIN_CORE_REF& ref) {
  return {handle, ref.deviceIndex, ref.userChainNumber, ref.coreIndex};
}

struct CoreRegistry {
  std::mutex mutex;
  std::map<Key, std::unique_ptr<Zin_Core>> cores;

  auto sessionBegin(uint32_t handle) { return cores.lower_bound(Key{handle, 0, 0, 0}); }
  bool isSession(std::map<Key, std::unique_ptr<Zin_Core>>::iterator it, uint32_t handle) {
    return it != cores.end() && std::get<0>(it->first) == handle;
  }
};

void destroySessionCores(uint32_t handle) {
  Zin_CoreList::removeSessionCores(handle);
}

CoreRegistry& registry() {
  static CoreRegistry instance;
  // The cores of a session go when the session closes; the hook is registered on first use.
  static std::once_flag hookRegistered;
  std::call_once(hookRegistered, [] { ZinJtag_addSessionCloseHook(&destroySessionCores); });
  return instance;
}

}  // namespace

Zin_Core* Zin_CoreList::getCore(uint32_t handle, ZIN_CORE_REF ref) {
  CoreRegistry& r = registry();
  std::lock_guard<std::mutex> guard(r.mutex);
  const auto it = r.cores.find(keyOf(handle, ref));
  return it != r.cores.end() ? it->second.get() : nullptr;
}

void Zin_CoreList::addCore(uint32_t handle, Zin_Core* core) {
  if (core == nullptr) throw std::invalid_argument("Zin_CoreList::addCore: null core");
  CoreRegistry& r = registry();
  std::unique_ptr<Zin_Core> replaced;
  {
    std::lock_guard<std::mutex> guard(r.mutex);
    const Key key = keyOf(handle, core->getCoreRef());
    for (const auto& [otherKey, other] : r.cores) {
      if (other.get() == core) {
        if (otherKey == key) return;  // already registered here: nothing to replace
        throw std::invalid_argument(
            "Zin_CoreList::addCore: the core is already registered under another reference");
      }
    }
    auto& slot = r.cores[key];
    replaced = std::move(slot);
    slot.reset(core);
  }
}

void Zin_CoreList::removeCore(uint32_t handle, Zin_Core** core) {
  if (core == nullptr) throw std::invalid_argument("Zin_CoreList::removeCore: null argument");
  if (*core == nullptr) return;
  CoreRegistry& r = registry();
  std::unique_ptr<Zin_Core> removed;
  {
    std::lock_guard<std::mutex> guard(r.mutex);
    // Found by address, so an unregistered (perhaps already destroyed) core is never touched.
    for (auto it = r.sessionBegin(handle); r.isSession(it, handle); ++it) {
      if (it->second.get() == *core) {
        removed = std::move(it->second);
        r.cores.erase(it);
        break;
      }
    }
  }
  *core = nullptr;
}

void Zin_CoreList::removeSessionCores(uint32_t handle) {
  CoreRegistry& r = registry();
  std::vector<std::unique_ptr<Zin_Core>> removed;
  {
    std::lock_guard<std::mutex> guard(r.mutex);
    auto it = r.sessionBegin(handle);
    while (r.isSession(it, handle)) {
      removed.push_back(std::move(it->second));
      it = r.cores.erase(it);
    }
  }
}

uint32_t Zin_CoreList::coreCount(uint32_t handle) {
  CoreRegistry& r = registry();
  std::lock_guard<std::mutex> guard(r.mutex);
  uint32_t count = 0;
  for (auto it = r.sessionBegin(handle); r.isSession(it, handle); ++it) ++count;
  return count;
}

}  // namespace ZinRT
