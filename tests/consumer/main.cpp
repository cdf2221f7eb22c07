// A host of the installed library: an unknown session must be reported as a failure, and the
// installed version header must name the version the build was made with.
#include <cstdio>
#include <cstring>

#include "ZinMOX/ZinMOX.h"
#include "ZinMOX/ZinMOX_Version.h"
#ifdef ZIN_CONSUMER_CLASSES
#include "ZinMOX/ZinMOX_Core.h"
#include "ZinSim/Description.h"
#endif

int main() {
  ZIN_CORE_REF ref{0, 0, 0};
  uint32_t isMox = 5;
  if (ZinMOX_isMOXCore(0, &ref, &isMox) != ZINMOX_FAILURE) return 1;
  if (std::strcmp(ZINMOX_VERSION_STRING, ZIN_EXPECTED_VERSION) != 0) return 2;
  std::puts("consumer ok");
  return 0;
}
