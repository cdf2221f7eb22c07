// A complete host: opens a session on the simulated demo design, prints a MOX core's decoded
// information, writes a named output and reads it back through the design's loopback wiring, and
// shows how a failure is reported. Builds against the installed headers and libraries alone.
#include <cstdio>
#include <memory>

#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinSim/Target.h"

namespace {

void printMessage(void*, uint32_t handle, uint32_t code, const char* text) {
  std::fprintf(stderr, "session %u, code %u: %s\n", handle, code, text);
}

int run(uint32_t handle) {
  ZIN_CORE_REF ref{0, 1, 0};  // device 0, user chain 1, core 0 of the demo design
  uint32_t isMox = 0;
  ZinMOX_isMOXCore(handle, &ref, &isMox);
  std::printf("core %u:%u:%u is %sa MOX core\n", ref.deviceIndex, ref.userChainNumber,
              ref.coreIndex, isMox ? "" : "not ");

  ZINMOX_CORE_INFO info;
  if (ZinMOX_getInfo(handle, &ref, &info) != ZINMOX_SUCCESS) return 1;
  std::printf(
      "manufacturer id      %u\ncore type            %u\ncore version         %u.%u rev %u\n"
      "qx version           %u.%u.%u\nasync inputs         %u\nsync inputs          %u\n"
      "async outputs        %u\nsync outputs         %u\n",
      info.manufacturer_id, info.core_type, info.core_major_version, info.core_minor_version,
      info.core_revision, info.qx_major_version, info.qx_minor_version, info.qx_minor_version_alpha,
      info.async_input_count, info.sync_input_count, info.async_output_count,
      info.sync_output_count);

  // The demo design loops asynchronous output bit i back to asynchronous input bit i.
  const uint32_t bits[] = {0, 1, 2, 3, 4, 5, 6, 7};
  if (ZinMOX_initCore(handle, &ref) != ZINMOX_SUCCESS ||
      ZinMOX_defineBus(handle, &ref, "leds", ZINMOX_ASYNC_OUTPUT, bits, 8) != ZINMOX_SUCCESS ||
      ZinMOX_defineBus(handle, &ref, "leds_in", ZINMOX_ASYNC_INPUT, bits, 8) != ZINMOX_SUCCESS) {
    return 1;
  }
  ZinRT::ZinMOX_ValueMap values{{"leds", "A5"}};
  auto word = reinterpret_cast<uintptr_t>(&values);
  if (ZinMOX_writeValues(handle, &ref, &word) != ZINMOX_SUCCESS) return 1;
  ZinRT::ZinMOX_ValueMap inputs;
  word = reinterpret_cast<uintptr_t>(&inputs);
  if (ZinMOX_readValues(handle, &ref, &word) != ZINMOX_SUCCESS) return 1;
  std::printf("wrote leds=A5, read leds_in=%s\n", inputs["leds_in"].c_str());
  if (inputs["leds_in"] != "A5") return 1;

  ZIN_CORE_REF empty{0, 1, 9};
  std::printf("asking for the information of an empty reference reports:\n");
  std::fflush(stdout);
  return ZinMOX_getInfo(handle, &empty, &info) == ZINMOX_FAILURE ? 0 : 1;
}

}  // namespace

int main() {
  const uint32_t handle = ZinJtag_openSession(std::make_shared<ZinSim::Target>());
  ZinJtag_setMessageHandler(handle, printMessage, nullptr);
  const int status = run(handle);
  ZinJtag_closeSession(handle);
  return status;
}
