// Failures of zinmox calls: the session messages a call produced, zinmox.Error, and the logger.
#ifndef ZINMOX_PYTHON_ERRORS_H
#define ZINMOX_PYTHON_ERRORS_H

#include <pybind11/pybind11.h>

#include <cstdint>
#include <exception>
#include <string>
#include <vector>

namespace zinmox {

/// One message that the library sent on a session.
struct Message {
  uint32_t code;
  std::string text;
};
using Messages = std::vector<Message>;

/// A failed call. Raised in C++ (also where the GIL is not held) and turned into zinmox.Error,
/// which carries the function, the messages and their codes.
class Failure : public std::exception {
 public:
  /// `text` is used when the call produced no message.
  Failure(std::string function, Messages messages, std::string text = {});
  const char* what() const noexcept override { return text_.c_str(); }
  const std::string& function() const { return function_; }
  const Messages& messages() const { return messages_; }

 private:
  std::string function_;
  Messages messages_;
  std::string text_;
};

/// Creates zinmox.Error and the translation of Failure into it, and translates the host
/// library's errors: a malformed text into ValueError, an unreachable target server into
/// ConnectionError.
void bindErrors(pybind11::module_& module);

/// Writes messages to the logger "zinmox" (GIL held): code 256 as errors, the abort code as
/// warnings, anything else as information.
void logMessages(uint32_t handle, const Messages& messages);

}  // namespace zinmox

#endif
