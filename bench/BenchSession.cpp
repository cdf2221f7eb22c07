// Session setup of the benchmarks.
#include "BenchSession.h"

#include <memory>
#include <string>

#include "NullTransport.h"
#include "ZinRT/ZinJtag.h"

namespace ZinBench {

namespace {

thread_local std::string lastMessage;

void keepMessage(void*, uint32_t, uint32_t, const char* text) {
  lastMessage = text;
}

ZinTestKit::MoxStatus statusOf(uint32_t width) {
  ZinTestKit::MoxStatus status;
  status.asyncInputCount = width;
  status.syncInputCount = width;
  status.asyncOutputCount = width;
  status.syncOutputCount = width;
  return status;
}

}  // namespace

BenchSession::BenchSession(benchmark::State& state, uint32_t width) : state_(state) {
  handle_ = ZinJtag_openSession(std::make_shared<NullTransport>(statusOf(width)));
  ZinJtag_setMessageHandler(handle_, &keepMessage, nullptr);
  check(ZinMOX_initCore(handle_, &ref_), "ZinMOX_initCore");
}

BenchSession::~BenchSession() {
  ZinJtag_closeSession(handle_);
}

bool BenchSession::check(uint32_t result, const char* what) {
  if (result == ZINMOX_SUCCESS) return true;
  state_.SkipWithError((std::string(what) + " failed: " + lastMessage).c_str());
  return false;
}

}  // namespace ZinBench
