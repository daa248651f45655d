// SPDX-License-Identifier: Apache-2.0
#include <charconv>
#include <cstdlib>
#include <string_view>

#include "lumolib/Client.h"
#include "wire/Limits.h"
#include "wire/Paths.h"

namespace LumoClient {

namespace {

std::string_view variable(char const *name) {
    char const *value = std::getenv(name);
    return value != nullptr ? value : "";
}

std::chrono::milliseconds timeoutFrom(std::string_view text) {
    std::int32_t number = 0;
    std::from_chars_result const end = std::from_chars(text.data(), text.data() + text.size(), number);
    bool const whole = end.ec == std::errc() && end.ptr == text.data() + text.size();
    return whole && number > 0 ? std::chrono::milliseconds(number) : Wire::defaultDeadline;
}

} // namespace

Settings Settings::fromEnvironment() {
    Settings settings;
    settings.root = Wire::rootFromEnvironment();
    settings.timeout = timeoutFrom(variable("TOVI_TIMEOUT_MS"));
    settings.requestId = variable("TOVI_REQUEST_ID");
    settings.offline = !variable("TOVI_OFFLINE").empty();
    return settings;
}

} // namespace LumoClient
