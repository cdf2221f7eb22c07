/* libZinNet: the host call that opens a JTAG session on a target server. Usable from C and C++.

   The session's transport is a TCP connection to a server started with `zinmox serve` (or
   ZinNet::Server). Close the session with ZinJtag_closeSession as any other. */
#ifndef ZINNET_ZINNET_H
#define ZINNET_ZINNET_H

#include <stdint.h>

#include "ZinNet/ZinNet_Export.h"

#ifdef __cplusplus
extern "C" {
#endif

/* Connects to the target server at host:port and opens a JTAG session on it. `timeoutMs` bounds
   the connection (resolution, connect and greeting) and every later request of the session;
   0 takes the defaults (3000 ms to connect, 10000 ms per request). Returns the session handle,
   or 0 when no session could be opened; ZinNet_lastError then tells why. A connection lost
   later fails the call in progress, and the session's next call connects again. */
ZINNET_API uint32_t ZinNet_openSession(const char* host, uint16_t port, uint32_t timeoutMs);

/* How to reach a target server beyond ZinNet_openSession's host, port and timeout. Set every
   field (zero-initialise the struct, then fill in what you need). */
typedef struct ZinNet_SessionOptions {
  const char* host;      /* the server's host name or address */
  uint16_t port;         /* its port */
  uint32_t timeoutMs;    /* as for ZinNet_openSession; 0 takes the defaults */
  const char* token;     /* NULL or "": no token; else the token both sides prove they know */
  int tls;               /* nonzero: speak TLS and check the server's certificate and host name */
  const char* tlsCaFile; /* NULL or "": the system's certificate authorities; else a PEM file */
} ZinNet_SessionOptions;

/* ZinNet_openSession with the options above (a token, TLS). Returns the session handle, or 0
   with ZinNet_lastError telling why (a null `options` too). */
ZINNET_API uint32_t ZinNet_openSessionWith(const ZinNet_SessionOptions* options);

/* The text of the calling thread's last ZinNet_openSession or ZinNet_openSessionWith failure
   ("" after a success). The
   text stays valid until the thread's next ZinNet_openSession call. */
ZINNET_API const char* ZinNet_lastError(void);

#ifdef __cplusplus
}
#endif

#endif
