// SPDX-License-Identifier: Apache-2.0
#include "orka/SystemReason.h"

#include <string_view>

namespace Orka {

std::string systemReason(kj::Exception const &exception) {
    std::string_view text(exception.getDescription().cStr());
    for (std::string_view const mark : {"reason = ", "gai_strerror(status) = "}) {
        if (auto const found = text.find(mark); found != std::string_view::npos) {
            return std::string(text.substr(found + mark.size()));
        }
    }
    if (auto const found = text.rfind(": "); found != std::string_view::npos) {
        text.remove_prefix(found + 2);
    }
    if (auto const end = text.find("; "); end != std::string_view::npos) {
        text = text.substr(0, end);
    }
    return std::string(text);
}

} // namespace Orka
