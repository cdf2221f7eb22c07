/* Compiles the function header as C and calls through it on an unknown session: each call must
   report failure, not crash. */
#include <stdio.h>
#include <string.h>

#include "ZinMOX/ZinMOX.h"

int main(void) {
  ZIN_CORE_REF ref = {0u, 0u, 0u};
  ZINMOX_CORE_INFO info;
  uint32_t result = 7u;
  memset(&info, 0xAB, sizeof info);
  if (sizeof(ZINMOX_CORE_INFO) != 48u) return 1;
  if (ZinMOX_getInfo(0u, &ref, NULL) != ZINMOX_FAILURE) return 2;
  if (ZinMOX_isMOXCore(0u, &ref, &result) != ZINMOX_FAILURE) return 3;
  puts("C header check passed");
  return 0;
}
