// SPDX-License-Identifier: Apache-2.0
//
// What the functions of the C interface share: the process-wide session, and the one place where an exception becomes
// a code. Every function there is: check the arguments, ask inside answer(), hand out the result on success.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "Connection.h"
#include "lumolib/LumoLib.h"

namespace LumoClient {

/// Runs the work with the session's connection to the ordered socket.
/// @return 0, or the code of what was thrown (NoSession without a session), which is then also noted as the last
///         failure
std::int32_t answer(FunctionRef<void(Connection &)> work) noexcept;

/// The same, with the particular sentence.
LumoErrorEx answerEx(FunctionRef<void(Connection &)> work) noexcept;

/// An argument as a text; a null pointer counts as an empty text.
std::string_view argument(char const *text);

/// @return the canonical form
/// @throw Wire::Failure InvalidArgument for a text that is no container id
std::string canonicalContainerId(char const *text);

/// @throw Wire::Failure InvalidArgument when there is nowhere to put a result
void requireOut(void const *out);

} // namespace LumoClient
