// Carries out one request frame on the served transport and builds the reply frame.
#ifndef ZINNET_SRC_REQUESTHANDLER_H
#define ZINNET_SRC_REQUESTHANDLER_H

#include <cstdint>
#include <vector>

#include "Frame.h"
#include "ZinRT/Zin_Transport.h"

namespace ZinNet {

/// The outcome of one request.
struct Reply {
  std::vector<unsigned char> bytes;  // the whole reply frame, prefix included
  bool carriedOut = false;           // the transport was called
  bool refused = false;              // the request was malformed or beyond the limits
};

/// Checks the request (status read, command sequence with or without its flush, flush or core
/// list) against the limits and
/// carries it out. A malformed request gets a refusal, an exception of the transport a target
/// failure frame with its text; nothing throws.
Reply carryOut(const Frame& request, ZinRT::Zin_Transport& transport, uint32_t maxReadBytes);

/// Whether a type byte is one of the requests carryOut takes in protocol `version`.
bool isRequest(Protocol::MessageType type, uint16_t version);

/// A frame holding a text (refusal, closing, target failure).
std::vector<unsigned char> textFrame(Protocol::MessageType type, std::string_view text);

}  // namespace ZinNet

#endif
