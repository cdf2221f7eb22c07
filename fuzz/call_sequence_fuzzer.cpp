// Random sequences of the exported calls (init, terminate, define, undefine, sizes, port and
// value calls, information) and of the array overloads of the value members, on a MOX core, a
// reference without a core and a core of another type. Every call must end in a result and
// messages that the outcome checks accept; the array overloads may only throw the library's
// own logic errors.
#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "FuzzInput.h"
#include "FuzzSession.h"
#include "ZinMOX/ZinMOX_Core.h"
#include "ZinRT/ZinJtag.h"
#include "ZinRT/Zin_CoreList.h"

using namespace ZinFuzz;

namespace {

constexpr const char* kNames[] = {"a", "B", "bus", "async_out_data", "sync_in_data", "", "A.b"};
constexpr uint32_t kNameCount = sizeof kNames / sizeof kNames[0];

struct Sequence {
  FuzzInput& in;
  FuzzSession& session;
  ZIN_CORE_REF refs[3];
  uint32_t widths[4];  // asynchronous in, synchronous in, asynchronous out, synchronous out

  ZIN_CORE_REF* ref() {
    const uint32_t pick = in.below(8);
    return pick == 7 ? nullptr : &refs[pick % 3];
  }
  const char* name() { return in.below(16) == 0 ? nullptr : kNames[in.below(kNameCount)]; }
  // 0, the port's width, or anything.
  uint32_t count(uint32_t width) {
    const uint32_t pick = in.below(4);
    return pick == 0 ? 0 : pick == 3 ? in.below(80) : width;
  }
  ZinRT::ZinMOX_ValueMap map() {
    ZinRT::ZinMOX_ValueMap values;
    for (uint32_t n = in.below(4); n > 0; --n) {
      std::string key = kNames[in.below(kNameCount)];
      if (in.below(3) == 0) key += ".pulsetrain";
      std::string text = in.text(0);
      values[key] = std::move(text);
    }
    return values;
  }

  void step();
  void arrayOverloads();
};

// Every value is read into a variable before the call: the order of reads must not depend on
// the compiler's order of evaluating arguments, or a corpus would replay differently.
void Sequence::step() {
  const uint32_t h = session.handle();
  std::vector<uint8_t> buffers(8 * 16 * 16, 0xA5);  // ample room for ports of up to 80 bits
  uint8_t* b = buffers.data();
  const uint32_t operation = in.below(12);
  if (operation == 11) return arrayOverloads();
  ZIN_CORE_REF* const coreRef = ref();
  switch (operation) {
    case 0:
      session.check("ZinMOX_initCore", ZinMOX_initCore(h, coreRef));
      break;
    case 1:
      session.check("ZinMOX_terminateCore", ZinMOX_terminateCore(h, coreRef));
      break;
    case 2: {
      const char* signal = name();
      const uint32_t type = in.below(5);
      const uint32_t bit = in.below(48);
      session.check("ZinMOX_defineSignal", ZinMOX_defineSignal(h, coreRef, signal, type, bit));
      break;
    }
    case 3: {
      const char* signal = name();
      const uint32_t type = in.below(5);
      std::vector<uint32_t> positions(in.below(10));
      for (uint32_t& p : positions) p = in.below(48);
      const uint32_t* array = in.below(8) == 0 ? nullptr : positions.data();
      session.check("ZinMOX_defineBus", ZinMOX_defineBus(h, coreRef, signal, type, array,
                                                         static_cast<uint32_t>(positions.size())));
      break;
    }
    case 4: {
      const char* signal = name();
      const uint32_t type = in.below(5);
      session.check("ZinMOX_undefineName", ZinMOX_undefineName(h, coreRef, signal, type));
      break;
    }
    case 5: {
      const char* names[3];
      for (const char*& n : names) n = name();
      uint32_t sizes[3] = {};
      const uint32_t length = in.below(4);
      const uint32_t isOutput = in.below(2);
      session.check("ZinMOX_getSignalSizes",
                    ZinMOX_getSignalSizes(h, coreRef, names, sizes, length, isOutput));
      break;
    }
    case 6: {
      const uint32_t asyncCount = count(widths[2]);
      const uint32_t syncCount = count(widths[3]);
      session.check("ZinMOX_setPortBits", ZinMOX_setPortBits(h, coreRef, b, b + 16, asyncCount,
                                                             b + 32, b + 300, syncCount));
      break;
    }
    case 7: {
      const uint32_t asyncCount = count(widths[0]);
      const uint32_t syncCount = count(widths[1]);
      session.check("ZinMOX_getPortBits",
                    ZinMOX_getPortBits(h, coreRef, b, b + 16, nullptr, asyncCount, b + 48, b + 64,
                                       b + 80, nullptr, b + 96, syncCount));
      break;
    }
    case 8: {
      ZinRT::ZinMOX_ValueMap values = map();
      uintptr_t word = reinterpret_cast<uintptr_t>(&values);
      session.check("ZinMOX_writeValues", ZinMOX_writeValues(h, coreRef, &word));
      break;
    }
    case 9: {
      ZinRT::ZinMOX_ValueMap values = map();
      uintptr_t word = in.below(8) == 0 ? 0 : reinterpret_cast<uintptr_t>(&values);
      session.check("ZinMOX_readValues", ZinMOX_readValues(h, coreRef, &word));
      break;
    }
    default: {
      ZinRT::ZinMOX_ValueMap values;
      uintptr_t word = reinterpret_cast<uintptr_t>(&values);
      session.check("ZinMOX_getCoreInfo", ZinMOX_getCoreInfo(h, coreRef, &word));
      ZINMOX_CORE_INFO info;
      session.check("ZinMOX_getInfo", ZinMOX_getInfo(h, coreRef, &info));
      break;
    }
  }
}

bool isArrayOverloadMessage(std::string_view text) {
  for (std::string_view start : {"Could not find a signal with the name: ",
                                 "Burst mode cannot be used with the non-synchronous output: ",
                                 "The size of the value is not large enough for the signal: ",
                                 "Invalid values for signal: ", "ZinMOX_Core::"}) {
    if (text.substr(0, start.size()) == start) return true;
  }
  return false;
}

// The array overloads are members only; they run under the session's target lock, as a caller
// inside the framework would run them.
void Sequence::arrayOverloads() {
  ZinJtagTargetLock lock(session.handle(), 60000);
  auto* core =
      dynamic_cast<ZinRT::ZinMOX_Core*>(ZinRT::Zin_CoreList::getCore(session.handle(), refs[0]));
  if (core == nullptr) return;
  std::vector<std::string> names;
  for (uint32_t n = in.below(3); n > 0; --n) names.emplace_back(kNames[in.below(kNameCount)]);
  const auto count = static_cast<uint32_t>(names.size());
  std::vector<std::vector<uint8_t>> blocks(count, std::vector<uint8_t>(in.below(200)));
  std::vector<const uint8_t*> values(count);
  std::vector<uint8_t*> outputs(count);
  std::vector<uint32_t> sizes(count);
  for (uint32_t i = 0; i < count; ++i) {
    const bool null = in.below(8) == 0;
    values[i] = outputs[i] = null ? nullptr : blocks[i].data();
    sizes[i] = static_cast<uint32_t>(blocks[i].size());
  }
  const uint32_t valueCount = in.below(20);
  const bool write = in.below(2) == 0;
  const uint32_t burstMode = in.below(3);
  try {
    if (write) {
      core->writeValues(session.handle(), refs[0], names, values.data(), sizes.data(), count,
                        valueCount, burstMode);
    } else {
      core->readValues(session.handle(), refs[0], names, outputs.data(), nullptr, outputs.data(),
                       nullptr, outputs.data(), sizes.data(), count, valueCount % 4);
    }
  } catch (const std::logic_error& error) {
    if (!isArrayOverloadMessage(error.what())) fail(std::string("array overload: ") + error.what());
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  FuzzInput in(data, size);
  FuzzSession session;
  Sequence sequence{in, session, {{1, 2, 0}, {0, 0, 1}, {3, 1, 1}}, {}};
  for (uint32_t& w : sequence.widths) w = in.below(40);
  session.placeCore(sequence.refs[0], sequence.widths[0], sequence.widths[1], sequence.widths[2],
                    sequence.widths[3]);
  session.transport().placeCore(sequence.refs[2], ZIN_CORE_INFO{7, 3, 1, 0, 0}, {1, 2, 3});
  for (uint32_t steps = 0; !in.empty() && steps < 64; ++steps) sequence.step();
  return 0;
}
