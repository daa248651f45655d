// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string_view>

#include "plexa/Display.h"

namespace Plexa {

/// The colours of formats for people; all empty where there is no colour.
struct Paint {
    explicit Paint(Display const &display)
        : heading(display.colour ? "\x1b[1m" : "")
        , label(display.colour ? "\x1b[36m" : "")
        , end(display.colour ? "\x1b[0m" : "") {}

    std::string_view heading;
    std::string_view label;
    std::string_view end;
};

} // namespace Plexa
