// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace Plexa {

/// A text as a JSON string, quotes included. Always valid: bytes that are no UTF-8 become the visible text \xff.
/// Characters that would act on a terminal are written as \u escapes, which every reader takes for the same text.
std::string jsonText(std::string_view text);

} // namespace Plexa
