// The one error of the host texts: a text that a user gave is malformed or out of range.
#ifndef ZINHOST_TEXTERROR_H
#define ZINHOST_TEXTERROR_H

#include <stdexcept>
#include <string>
#include <string_view>

namespace ZinHost {

/// A reference, value, bit list, name or target text that cannot be used. Clients report it as
/// a usage error (the tool: exit status 2) or as a bad argument (Python: ValueError).
class TextError : public std::invalid_argument {
 public:
  using std::invalid_argument::invalid_argument;
};

/// `text` for a message: whole when short, else its first characters and "...", so that a huge
/// argument is never echoed in full.
std::string quoteShort(std::string_view text);

}  // namespace ZinHost

#endif
