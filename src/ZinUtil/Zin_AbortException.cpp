// The abort exception: its text is fixed, the specific message having been sent already.
#include "ZinRT/Zin_AbortException.h"

namespace ZinRT {

Zin_AbortException::Zin_AbortException() : std::logic_error("Zin abort command") {}

Zin_AbortException::~Zin_AbortException() = default;

}  // namespace ZinRT
