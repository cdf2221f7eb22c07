// Server side of each request: decode, bound, call the transport, encode the answer.
#include "RequestHandler.h"

#include <exception>
#include <string>

namespace ZinNet {

using Protocol::MessageType;

namespace {

std::vector<unsigned char> readStatus(const Frame& request, ZinRT::Zin_Transport& transport) {
  FrameReader in(request, "status read");
  ZIN_CORE_REF ref{};
  ref.deviceIndex = in.u32();
  ref.userChainNumber = in.u32();
  ref.coreIndex = in.u32();
  const uint32_t statusBytes = in.u32();
  const uint32_t statusBits = in.u32();
  in.end();
  if (statusBytes > Protocol::kMaxStatusBytes) {
    throw FrameError("status read of " + std::to_string(statusBytes) + " bytes (at most " +
                     std::to_string(Protocol::kMaxStatusBytes) + ")");
  }
  if (statusBits > 8 * statusBytes) {
    throw FrameError("status read of " + std::to_string(statusBits) + " bits into " +
                     std::to_string(statusBytes) + " bytes");
  }
  ZIN_CORE_INFO info{};
  std::vector<unsigned char> status(statusBytes, 0);
  transport.readStatus(ref, info, status.data(), statusBytes, statusBits);
  FrameWriter out(MessageType::Status);
  out.u32(info.manufacturerId).u32(info.coreType).u32(info.coreMajorVersion);
  out.u32(info.coreMinorVersion).u32(info.coreRevision);
  return out.bytes(status.data(), status.size()).finish();
}

// A command sequence, and with `thenFlush` the flush after it (which a failed sequence skips).
std::vector<unsigned char> commandSequence(const Frame& request, ZinRT::Zin_Transport& transport,
                                           uint32_t maxReadBytes, bool thenFlush) {
  FrameReader in(request, thenFlush ? "command sequence and flush" : "command sequence");
  const uint32_t readBits = in.u32();
  const std::string text = in.rest();
  const uint32_t readBytes = readBits / 8 + (readBits % 8 != 0 ? 1 : 0);
  if (readBytes > maxReadBytes) {
    throw FrameError("command sequence asks for " + std::to_string(readBytes) +
                     " bytes of read data (at most " + std::to_string(maxReadBytes) + ")");
  }
  std::vector<unsigned char> data(readBytes, 0);
  unsigned char* into = readBits != 0 ? data.data() : nullptr;
  if (thenFlush) {
    transport.commandSequenceThenFlush(text, into, readBits);
  } else {
    transport.commandSequence(text, into, readBits);
  }
  return FrameWriter(MessageType::ReadData).bytes(data.data(), data.size()).finish();
}

std::vector<unsigned char> flush(const Frame& request, ZinRT::Zin_Transport& transport) {
  FrameReader(request, "flush").end();
  transport.flush();
  return FrameWriter(MessageType::Flushed).finish();
}

std::vector<unsigned char> listCores(const Frame& request, ZinRT::Zin_Transport& transport) {
  FrameReader(request, "core list").end();
  std::vector<ZIN_CORE_REF> refs;
  const bool supported = transport.listCores(refs);
  if (!supported) refs.clear();
  FrameWriter out(MessageType::Cores);
  out.u8(supported ? 1 : 0).u32(static_cast<uint32_t>(refs.size()));
  for (const ZIN_CORE_REF& ref : refs) {
    out.u32(ref.deviceIndex).u32(ref.userChainNumber).u32(ref.coreIndex);
  }
  return out.finish();
}

std::vector<unsigned char> dispatch(const Frame& request, ZinRT::Zin_Transport& transport,
                                    uint32_t maxReadBytes) {
  switch (request.type) {
    case MessageType::ReadStatus:
      return readStatus(request, transport);
    case MessageType::CommandSequence:
      return commandSequence(request, transport, maxReadBytes, false);
    case MessageType::SequenceAndFlush:
      return commandSequence(request, transport, maxReadBytes, true);
    case MessageType::Flush:
      return flush(request, transport);
    case MessageType::ListCores:
      return listCores(request, transport);
    default:
      throw FrameError("not a request: " + typeText(static_cast<uint8_t>(request.type)));
  }
}

}  // namespace

bool isRequest(MessageType type, uint16_t version) {
  if (type == MessageType::SequenceAndFlush) return version >= 2;
  return type == MessageType::ReadStatus || type == MessageType::CommandSequence ||
         type == MessageType::Flush || type == MessageType::ListCores;
}

std::vector<unsigned char> textFrame(MessageType type, std::string_view text) {
  return FrameWriter(type).text(boundedText(text)).finish();
}

Reply carryOut(const Frame& request, ZinRT::Zin_Transport& transport, uint32_t maxReadBytes) {
  Reply reply;
  try {
    reply.bytes = dispatch(request, transport, maxReadBytes);
    reply.carriedOut = true;
  } catch (const FrameError& e) {
    reply.refused = true;
    reply.bytes = textFrame(MessageType::Refused, e.what());
  } catch (const std::exception& e) {
    reply.carriedOut = true;
    reply.bytes = textFrame(MessageType::TargetFailed, e.what());
  } catch (...) {
    reply.carriedOut = true;
    reply.bytes = textFrame(MessageType::TargetFailed, "the target failed with an unknown error");
  }
  return reply;
}

}  // namespace ZinNet
