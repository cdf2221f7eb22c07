// The exception that ends a call after its specific message has already been sent.
#ifndef ZINRT_ZIN_ABORTEXCEPTION_H
#define ZINRT_ZIN_ABORTEXCEPTION_H

#include <stdexcept>

#include "ZinRT/ZinUtil_Export.h"

namespace ZinRT {

/// Thrown after a specific failure message has been sent to the session; its text is always
/// "Zin abort command", which the call frame reports with the abort code 32768.
class ZINUTIL_API Zin_AbortException : public std::logic_error {
 public:
  Zin_AbortException();
  ~Zin_AbortException() override;
};

}  // namespace ZinRT

#endif
