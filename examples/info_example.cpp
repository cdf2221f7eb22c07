// A minimal host: open a session on a scripted target with one MOX core, ask whether it is a MOX
// core, and print its decoded information.
#include <cstdio>
#include <memory>

#include "ZinMOX/ZinMOX.h"
#include "ZinRT/ZinJtag.h"
#include "ZinTarget/ScriptedTransport.h"

namespace {

void printMessage(void*, uint32_t handle, uint32_t code, const char* text) {
  std::fprintf(stderr, "session %u, code %u: %s\n", handle, code, text);
}

}  // namespace

int main() {
  auto target = std::make_shared<ZinTarget::ScriptedTransport>();
  ZIN_CORE_REF ref{1, 2, 0};
  ZinTarget::MoxStatus status;
  status.majorVersion = 10;
  status.minorVersion = 2;
  status.asyncInputCount = 16;
  status.syncInputCount = 12;
  status.asyncOutputCount = 16;
  status.syncOutputCount = 8;
  status.qxMajorVersion = 1;
  status.qxMinorVersion = 4;
  target->placeMoxCore(ref, status);

  const uint32_t handle = ZinJtag_openSession(target);
  ZinJtag_setMessageHandler(handle, printMessage, nullptr);

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

  ZIN_CORE_REF empty{0, 0, 5};
  std::printf("asking for the information of an empty reference reports:\n");
  std::fflush(stdout);
  ZinMOX_getInfo(handle, &empty, &info);
  ZinJtag_closeSession(handle);
  return 0;
}
