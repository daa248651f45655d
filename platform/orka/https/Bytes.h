// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <optional>
#include <string>

#include <kj/async-io.h>
#include <kj/compat/http.h>

namespace Orka::Https {

/// Reads a stream to its end; nothing when it holds more than `most` bytes, of which no more are then read. Room is
/// taken for what has come, not for what was announced. The stream is the caller's until the promise is done.
kj::Promise<std::optional<std::string>> readUpTo(kj::AsyncInputStream &stream, std::size_t most);

/// Whether a head says that JSON follows; the type's case and its parameters do not matter.
bool isJson(kj::HttpHeaders const &headers);

} // namespace Orka::Https
