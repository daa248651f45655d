// SPDX-License-Identifier: Apache-2.0
#include "ErrorReport.h"

#include "plexa/JsonText.h"
#include "plexa/Text.h"

namespace Tovicli {

using namespace Plexa;

namespace {

std::string_view withoutLineEnd(std::string_view text) {
    return text.ends_with('\n') ? text.substr(0, text.size() - 1) : text;
}

std::string jsonOrNull(std::string_view text) {
    return text.empty() ? "null" : jsonText(text);
}

} // namespace

void ErrorReport::warn(std::string_view text) {
    line("tovicli: warning: ", text);
}

void ErrorReport::fail(std::string_view message, std::optional<LastFailure> const &cause, std::string_view hint) {
    if (machine_) {
        std::string document = "{\"error\":{\"message\":" + jsonText(withoutLineEnd(message));
        document += ",\"cause\":" + jsonOrNull(cause ? cause->sentence : std::string());
        document += ",\"code\":" + (cause ? std::to_string(cause->code) : std::string("null"));
        document += ",\"requestId\":" + jsonOrNull(cause ? cause->requestId : std::string()) + "}}\n";
        sink_.write(document);
        return;
    }
    line("tovicli: ", message);
    if (cause && !cause->sentence.empty() && message.find(cause->sentence) == std::string_view::npos) {
        bool const withId = showRequestId_ && !cause->requestId.empty();
        line("tovicli: cause: ", cause->sentence + (withId ? " (request " + cause->requestId + ")" : ""));
    }
    if (!hint.empty()) {
        line("tovicli: ", hint);
    }
}

void ErrorReport::line(std::string_view prefix, std::string_view text) {
    sink_.write(std::string(prefix) + escaped(withoutLineEnd(text), Lines::Keep) + "\n");
}

} // namespace Tovicli
