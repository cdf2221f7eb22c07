// The shared secret of a target server and its clients: where it comes from and what it may be.
#ifndef ZINNET_TOKEN_H
#define ZINNET_TOKEN_H

#include <cstddef>
#include <string>

#include "ZinNet/ZinNet_Export.h"

namespace ZinNet {

/// The environment variable that servers and clients read the token from when they are given
/// no token file.
inline constexpr const char* kTokenVariable = "ZINMOX_TOKEN";
/// A token has at least this many bytes (a guessable token protects nothing) ...
inline constexpr std::size_t kMinTokenBytes = 16;
/// ... and at most this many.
inline constexpr std::size_t kMaxTokenBytes = 1024;

/// Throws std::invalid_argument naming `origin` ("the token file F") when `token` is empty, too
/// short or too long. The text never holds the token.
ZINNET_API void checkToken(const std::string& token, const std::string& origin);

/// The token held in the file at `path`: its bytes without one trailing line end. Throws
/// std::invalid_argument when the file cannot be read, is larger than a token can be, or holds
/// an unusable token.
ZINNET_API std::string readTokenFile(const std::string& path);

/// The token of the ZINMOX_TOKEN variable, "" when it is not set. Throws std::invalid_argument
/// when it is set but unusable (an empty variable too: a script that meant to set it failed).
ZINNET_API std::string tokenFromEnvironment();

}  // namespace ZinNet

#endif
