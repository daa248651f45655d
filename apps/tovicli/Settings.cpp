// SPDX-License-Identifier: Apache-2.0
#include "Settings.h"

#include <algorithm>
#include <charconv>

#include "plexa/FormatSettings.h"
#include "plexa/Formatter.h"
#include "plexa/Text.h"
#include "plexa/UsageError.h"

namespace Tovicli {

using namespace Plexa;

namespace {

constexpr int64_t defaultTimeoutMs = 30000;
constexpr int64_t longestTimeoutMs = 24 * 60 * 60 * 1000;
constexpr char const *timeoutForms = "seconds, or milliseconds as in 500ms, from 1ms to 86400 are expected";

/// A value and the option or variable that it stood in.
struct Source {
    std::string origin;
    std::string value;
};

std::optional<Source> lookUp(CallSpec::Input const &options, Environment const *environment, std::string const &option,
                             std::string const &variable) {
    if (options.HasParameter(option)) {
        return Source{"--" + option, options.GetString(option)};
    }
    if (environment != nullptr) {
        if (std::optional<std::string> value = environment->get(variable); value && !value->empty()) {
            return Source{variable, *value};
        }
    }
    return std::nullopt;
}

/// A whole number of digits only; nothing for anything else or too large a number.
std::optional<int64_t> wholeNumber(std::string_view text) {
    int64_t number = 0;
    auto const [position, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    bool const whole = error == std::errc() && position == text.data() + text.size() && text[0] != '-';
    return whole ? std::optional(number) : std::nullopt;
}

int64_t timeoutFrom(Source const &source, int64_t unitMs) {
    std::string_view text = source.value;
    if (text.ends_with("ms")) {
        text.remove_suffix(2);
        unitMs = 1;
    } else if (text.ends_with("s")) {
        text.remove_suffix(1);
        unitMs = 1000;
    }
    std::optional<int64_t> const number = wholeNumber(text);
    if (!number || *number < 1 || *number > longestTimeoutMs / unitMs) {
        throw UsageError(source.origin + ": " + shownWord(source.value) + " is no timeout; " + timeoutForms);
    }
    return *number * unitMs;
}

int64_t timeout(CallSpec::Input const &options, Environment const *environment) {
    std::optional<Source> const source = lookUp(options, environment, "timeout", "TOVI_TIMEOUT_MS");
    if (!source) {
        return defaultTimeoutMs;
    }
    return timeoutFrom(*source, source->origin == "--timeout" ? 1000 : 1);
}

std::optional<std::string> logLevel(CallSpec::Input const &options, Environment const *environment) {
    std::optional<Source> const source = lookUp(options, environment, "log-level", "TOVI_LOG_LEVEL");
    if (!source) {
        return std::nullopt;
    }
    for (char const *known : {"quiet", "panic", "error", "warning", "info", "verbose", "trivia"}) {
        if (Plexa::equalIgnoringCase(source->value, known)) {
            return known;
        }
    }
    throw UsageError(source->origin + ": " + shownWord(source->value) +
                     " is no log level; there is quiet, panic, error, warning, info, verbose, trivia");
}

/// Names the run in the daemon's log, in error documents and traces; so nothing that would have to be escaped there.
std::optional<std::string> requestId(Environment const *environment) {
    constexpr std::size_t longest = 128;
    std::optional<std::string> const id = environment != nullptr ? environment->get("TOVI_REQUEST_ID") : std::nullopt;
    if (!id || id->empty()) {
        return std::nullopt;
    }
    bool const isPlain = std::all_of(id->begin(), id->end(), [](char c) {
        return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '-' || c == '_' ||
               c == '.' || c == ':';
    });
    if (!isPlain || id->size() > longest) {
        throw UsageError("TOVI_REQUEST_ID: " + shownWord(*id) +
                         " is no request id; at most 128 letters, digits and any of -_.: are expected");
    }
    return id;
}

std::string path(CallSpec::Input const &options, Environment const *environment, Defaults const &defaults,
                 std::string const &option, std::string const &variable, std::string const &fallback) {
    std::optional<Source> const source = lookUp(options, environment, option, variable);
    if (!source) {
        return fallback;
    }
    if (environment == nullptr) {
        throw UsageError(source->origin + " cannot be used: this program runs with rights that its caller lacks");
    }
    if (source->value.empty()) {
        throw UsageError(source->origin + ": a directory is expected, an empty text was given");
    }
    std::string absolute = source->value[0] == '/' ? source->value : defaults.workingDirectory + "/" + source->value;
    while (absolute.size() > 1 && absolute.back() == '/') {
        absolute.pop_back();
    }
    return absolute;
}

void declare(CallSpec::InputSpec &spec, char const *name, CallSpec::ParameterType type, std::string const &description,
             char const *alias = "") {
    auto const parameter = CallSpec::ParameterSpec::New(name, type);
    parameter->SetDescription(description);
    parameter->SetAlias(alias);
    spec.AddParameter(parameter);
}

} // namespace

boost::shared_ptr<CallSpec::InputSpec> globalOptions() {
    auto const spec = CallSpec::InputSpec::New();
    declare(*spec, "format", CallSpec::String,
            "How the result is printed: " + formatNames() +
                ". Default: TOVI_FORMAT, else what the command names, else simple.");
    declare(*spec, "format-param", CallSpec::StringList,
            "A setting of the format as key=value, added to or in place of the command's own: fields:<structure>, "
            "header:<structure>, table-columns, units:<structure>.<field>.");
    declare(*spec, "fields", CallSpec::String, "Fields of the result to print, separated by commas, in this order.");
    declare(*spec, "root", CallSpec::String, "The host's directory. Default: TOVI_ROOT, else /var/lib/tovi.");
    declare(*spec, "timeout", CallSpec::String,
            "The longest that a request to the daemon may take, in seconds or as in 500ms. Default: TOVI_TIMEOUT_MS, "
            "else 30.");
    declare(*spec, "log-level", CallSpec::String,
            "How much is told: quiet, panic, error, warning, info, verbose, trivia. Default: TOVI_LOG_LEVEL.");
    declare(*spec, "plugins", CallSpec::String,
            "The directory of plug-ins. Default: TOVI_PLUGINS, else the tool's own.");
    declare(*spec, "version", CallSpec::Flag, "Print the version.");
    declare(*spec, "help", CallSpec::Flag, "Print what a namespace holds or how a command is used.", "h");
    return spec;
}

Settings settingsFrom(CallSpec::Input const &options, Environment const *environment, Defaults const &defaults) {
    Settings settings;
    if (std::optional<Source> const format = lookUp(options, environment, "format", "TOVI_FORMAT")) {
        settings.format = requireFormat(format->value, format->origin).name;
    }
    settings.formatParameters = options.GetStringList("format-param");
    for (std::string const &parameter : settings.formatParameters) {
        FormatSettings().setFromUser(parameter);
    }
    if (options.HasParameter("fields")) {
        settings.fields = options.GetString("fields");
    }
    settings.root = path(options, environment, defaults, "root", "TOVI_ROOT", "/var/lib/tovi");
    settings.timeoutMs = timeout(options, environment);
    settings.logLevel = logLevel(options, environment);
    settings.requestId = requestId(environment);
    settings.pluginDirectory =
        path(options, environment, defaults, "plugins", "TOVI_PLUGINS", defaults.pluginDirectory);
    settings.version = options.GetBool("version");
    settings.help = options.GetBool("help");
    return settings;
}

} // namespace Tovicli
