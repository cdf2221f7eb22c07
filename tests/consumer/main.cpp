// A host of the installed library: an unknown session must be reported as a failure.
#include <cstdio>

#include "ZinMOX/ZinMOX.h"

int main() {
  ZIN_CORE_REF ref{0, 0, 0};
  uint32_t isMox = 5;
  if (ZinMOX_isMOXCore(0, &ref, &isMox) != ZINMOX_FAILURE) return 1;
  std::puts("consumer ok");
  return 0;
}
