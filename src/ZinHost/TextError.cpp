// Short quotations of user texts in messages.
#include "ZinHost/TextError.h"

namespace ZinHost {

namespace {

constexpr size_t kQuotedChars = 40;

}  // namespace

std::string quoteShort(std::string_view text) {
  if (text.size() <= kQuotedChars) return std::string(text);
  return std::string(text.substr(0, kQuotedChars - 3)) + "...";
}

}  // namespace ZinHost
