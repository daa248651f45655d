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

std::string_view withoutLineEnds(std::string_view text) {
    while (text.ends_with('\n')) {
        text.remove_suffix(1);
    }
    return text;
}

std::string jsonOrNull(std::string_view text) {
    return text.empty() ? "null" : jsonText(text);
}

/// "what failed: cause", unless the one holds the other.
std::string joined(std::string_view message, std::string_view cause) {
    if (cause.empty() || message.find(cause) != std::string_view::npos) {
        return std::string(message);
    }
    message = withoutLineEnds(message);
    bool const isSentence = message.ends_with('.') || message.ends_with(':');
    return std::string(message) + (message.empty() ? "" : isSentence ? " " : ": ") + std::string(cause);
}

} // namespace

void ErrorReport::warn(std::string_view text) {
    if (machine_) {
        held_.emplace_back(text);
    } else {
        line("tovicli: warning: ", text);
    }
}

void ErrorReport::fail(std::string_view message, std::optional<LastFailure> const &cause, std::string_view hint) {
    if (machine_) {
        sink_.write(document(message, cause, hint));
        held_.clear();
        return;
    }
    std::string text = joined(message, cause ? cause->sentence : std::string());
    if (showRequestId_ && cause && !cause->requestId.empty()) {
        text = std::string(withoutLineEnds(text)) + " [request " + cause->requestId + "]";
    }
    if (!hint.empty()) {
        text = std::string(withoutLineEnds(text)) + " (" + std::string(hint) + ")";
    }
    line("tovicli: ", text);
}

void ErrorReport::finish() {
    if (machine_ && !held_.empty()) {
        sink_.write("{\"warnings\":" + warningList() + "}\n");
    } else {
        for (std::string const &text : held_) {
            line("tovicli: warning: ", text);
        }
    }
    held_.clear();
}

std::string ErrorReport::document(std::string_view message, std::optional<LastFailure> const &cause,
                                  std::string_view hint) const {
    std::string text = "{\"error\":{\"message\":" + jsonText(withoutLineEnd(message));
    text += ",\"cause\":" + jsonOrNull(cause ? cause->sentence : std::string());
    text += ",\"code\":" + (cause ? std::to_string(cause->code) : std::string("null"));
    text += ",\"hint\":" + jsonOrNull(hint);
    text += ",\"requestId\":" + jsonOrNull(requestId_);
    text += ",\"warnings\":" + warningList() + "}}\n";
    return text;
}

std::string ErrorReport::warningList() const {
    std::string list;
    for (std::string const &text : held_) {
        list += (list.empty() ? "" : ",") + jsonText(withoutLineEnd(text));
    }
    return "[" + list + "]";
}

void ErrorReport::line(std::string_view prefix, std::string_view text) {
    sink_.write(std::string(prefix) + escaped(withoutLineEnd(text), Lines::Keep) + "\n");
}

} // namespace Tovicli
