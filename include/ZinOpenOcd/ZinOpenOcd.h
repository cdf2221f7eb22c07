/* libZinOpenOcd: the host call that opens a JTAG session on a board behind a running OpenOCD.
   Usable from C and C++.

   The session's transport speaks the hub protocol through OpenOCD's Tcl server, so any cable
   OpenOCD drives reaches the cores. Close the session with ZinJtag_closeSession as any other. */
#ifndef ZINOPENOCD_ZINOPENOCD_H
#define ZINOPENOCD_ZINOPENOCD_H

#include <stdint.h>

#define ZINOPENOCD_API __attribute__((visibility("default")))

#ifdef __cplusplus
extern "C" {
#endif

/* Connects to OpenOCD's Tcl server at host:port, checks the board against OpenOCD's scan chain
   (TAP names, IR lengths, expected IDCODEs) and opens a JTAG session. `board` is NULL or "" for
   the RTL model's board, a preset name ("rtl-model", "xilinx-7series", "ecp5"), a JSON text
   starting with '{', or the path of a board file (docs/hardware.md). `timeoutMs` bounds
   connecting and every request; 0 takes the defaults (3000 ms to connect, 10000 ms per request).
   Returns the session handle, or 0 when no session could be opened; ZinOpenOcd_lastError then
   tells why. A connection lost later fails the call in progress, and the next call connects
   again. */
ZINOPENOCD_API uint32_t ZinOpenOcd_openSession(const char* host, uint16_t port, const char* board,
                                               uint32_t timeoutMs);

/* The text of the calling thread's last ZinOpenOcd_openSession failure ("" after a success).
   Valid until the thread's next ZinOpenOcd_openSession call. */
ZINOPENOCD_API const char* ZinOpenOcd_lastError(void);

#ifdef __cplusplus
}
#endif

#endif
