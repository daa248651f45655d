// SPDX-License-Identifier: Apache-2.0
#include "Tool.h"

#include <exception>

#include "FailureText.h"
#include "Help.h"
#include "Hints.h"

#include "plexa/Text.h"
#include "plexa/UsageError.h"
#include "wire/ErrorCode.h"

namespace Tovicli {

using namespace Plexa;

namespace {

constexpr char const *program = "tovicli";
constexpr char const *version = TOVI_VERSION;
/// The kernel takes no longer word either; here so that a caller in the same process meets the same limit.
constexpr std::size_t longestArgument = 128 * 1024;

/// @throws UsageError for a word that cannot be a text
void checkWords(std::vector<std::string> const &words) {
    for (std::size_t i = 0; i < words.size(); ++i) {
        if (words[i].size() > longestArgument) {
            throw UsageError("argument " + std::to_string(i + 1) + " is too long: " + std::to_string(words[i].size()) +
                             " bytes, at most " + std::to_string(longestArgument) + " are taken");
        }
        if (!isValidUtf8(words[i])) {
            throw UsageError("argument " + std::to_string(i + 1) + " is not valid UTF-8: " + shownWord(words[i]));
        }
    }
}

MapEnvironment copied(Environment const &environment) {
    MapEnvironment copy;
    for (char const *name : {"TOVI_FORMAT", "TOVI_LOG_LEVEL", "TOVI_OFFLINE", "TOVI_PLUGINS", "TOVI_REQUEST_ID",
                             "TOVI_ROOT", "TOVI_TIMEOUT_MS"}) {
        if (std::optional<std::string> const value = environment.get(name)) {
            copy.set(name, *value);
        }
    }
    return copy;
}

bool contains(std::string const &text, std::string const &part) {
    return text.find(part) != std::string::npos;
}

bool saysDaemonDead(std::optional<LastFailure> const &cause) {
    return cause && cause->code == static_cast<int32_t>(Wire::ErrorCode::DaemonNotRunning);
}

/// Counts what goes through.
class CountingSink : public Sink {
public:
    explicit CountingSink(Sink &to)
        : to_(to) {}
    void write(std::string_view text) override {
        bytes_ += static_cast<int64_t>(text.size());
        to_.write(text);
    }
    std::string problem() const override {
        return to_.problem();
    }
    int64_t bytes() const {
        return bytes_;
    }

private:
    Sink &to_;
    int64_t bytes_ = 0;
};

} // namespace

Tool::Tool(Context &context, Tree tree)
    : context_(context)
    , report_(context.errors)
    , trace_(context.errors, context.clock)
    , cli_(context, report_, tree == Tree::Kept)
    , tree_(tree) {}

std::string Tool::versionText() {
    return version;
}

ExitStatus Tool::run(std::vector<std::string> const &arguments) {
    requestId_.clear(); // each run is a request of its own
    ExitStatus const status = runReported(arguments);
    report_.finish();
    trace_.release();
    if (trace_.isEnabled()) {
        context_.plugins.traceRequests({});
        Trace::Event(trace_, "end").number("status", static_cast<int64_t>(status));
    }
    return status;
}

ExitStatus Tool::runReported(std::vector<std::string> const &arguments) {
    try {
        if (arguments.empty()) {
            throw UsageError("the argument list is empty, the program's name is expected first");
        }
        std::vector<std::string> const words(arguments.begin() + 1, arguments.end());
        report_.setMachine(looksMachine(words));
        checkWords(words);
        return runWords(words);
    } catch (UsageError const &mistake) {
        report_.fail(mistake.sentence(), std::nullopt, "try 'tovicli --help'");
        return ExitStatus::Usage;
    } catch (std::exception const &failure) { // memory, or a command that cannot even describe itself
        report_.fail(textOf(failure));
        return ExitStatus::Failed;
    }
}

ExitStatus Tool::runWords(std::vector<std::string> const &words) {
    // As the user set it: the settings themselves will be written over it.
    MapEnvironment const original = context_.privileged ? MapEnvironment() : copied(context_.environment);
    Environment const *const environment = context_.privileged ? nullptr : &original;
    FirstReading const reading = readAhead(words);
    Settings settings = settingsFrom(*reading.certain, environment, context_.defaults);
    if (settings.version) {
        return showVersion();
    }
    if (settings.logLevel != "trivia") {
        trace_.hold(); // a --log-level further on may be the command's own
    }
    try {
        settings = settingsFrom(*reading.probable, environment, context_.defaults);
    } catch (UsageError const &) {
        // May be a command's value of its own; the full reading decides.
    }
    offlineByUser_ = original.get("TOVI_OFFLINE").has_value();
    path_.assign(words.begin() + static_cast<std::ptrdiff_t>(reading.pathAt), words.end());
    Root root = treeFor(settings);
    Misread mistake;
    CommandLine line = readCommandLine(root, words, mistake);
    Settings full = settings_;
    if (mistake.sentence.empty()) {
        full = settingsFrom(*line.global, environment, context_.defaults);
        if (!full.servesSamePlugins(settings_)) {
            // What looked like a global option was a value of the command's: begin again under the right settings.
            line = CommandLine();
            root = treeFor(full);
            line = readCommandLine(root, words, mistake);
        }
    }
    apply(full);
    trace_.release();
    traceParsed(line);
    for (std::string const &trouble : registration_.troubles) {
        report_.warn(trouble);
    }
    if (!mistake.sentence.empty()) {
        return misread(mistake);
    }
    if (full.version) {
        return showVersion();
    }
    auto const command = boost::dynamic_pointer_cast<AutoCli::Command>(line.node);
    return command == nullptr || full.help ? showHelp(*line.node) : runCommand(*command, line);
}

void Tool::apply(Settings const &settings) {
    settings_ = settings;
    if (requestId_.empty()) {
        requestId_ = settings.requestId ? *settings.requestId : context_.newRequestId();
        report_.setRequestId(requestId_);
    }
    startTrace(settings.logLevel);
    Environment &environment = context_.environment;
    environment.set("TOVI_ROOT", settings.root);
    environment.set("TOVI_TIMEOUT_MS", std::to_string(settings.timeoutMs));
    environment.set("TOVI_REQUEST_ID", requestId_);
    if (settings.logLevel) {
        environment.set("TOVI_LOG_LEVEL", *settings.logLevel);
    } else {
        environment.unset("TOVI_LOG_LEVEL");
    }
    bool const machine = settings.format && findFormat(*settings.format)->isMachine;
    report_.setMachine(machine);
    report_.setShowRequestId(settings.logLevel == "verbose" || settings.logLevel == "trivia");
}

void Tool::startTrace(std::optional<std::string> const &logLevel) {
    bool const wanted = logLevel == "trivia";
    if (wanted && !trace_.isEnabled()) {
        trace_.setEnabled(true);
        Trace::Event(trace_, "run").text("version", version).text("request", requestId_);
    }
    trace_.setEnabled(wanted);
}

void Tool::traceParsed(CommandLine const &line) {
    if (!trace_.isEnabled()) {
        return;
    }
    Trace::Event(trace_, "parsed")
        .text("path", line.node->GetPathString(' '))
        .text("root", settings_.root)
        .number("timeoutMs", settings_.timeoutMs);
    context_.plugins.traceRequests([this](RequestDone const &done) {
        Trace::Event(trace_, "call")
            .text("method", done.method)
            .text("request", done.requestId)
            .text("socket", done.socketPath)
            .number("sentBytes", static_cast<int64_t>(done.sentBytes))
            .number("receivedBytes", static_cast<int64_t>(done.receivedBytes))
            .number("replies", done.replies)
            .number("code", done.code)
            .duration("tookMs", done.took);
    });
}

bool Tool::looksMachine(std::vector<std::string> const &words) const {
    std::string format = context_.privileged ? "" : context_.environment.get("TOVI_FORMAT").value_or("");
    for (std::size_t i = 0; i < words.size(); ++i) {
        if (words[i].starts_with("--format=")) {
            format = words[i].substr(std::string_view("--format=").size());
        } else if (words[i] == "--format" && i + 1 < words.size()) {
            format = words[i + 1];
        }
    }
    Format const *const known = findFormat(format);
    return known != nullptr && known->isMachine;
}

ExitStatus Tool::misread(Misread const &mistake) {
    if (mistake.unknownWord && !registration_.troubles.empty()) {
        if (registration_.daemonMissing) {
            report_.warn(daemonSentence());
        }
        report_.fail(mistake.sentence, std::nullopt, "a plug-in that could not be loaded may hold it");
        return ExitStatus::Unavailable;
    }
    std::string const path = mistake.node->GetPathString(' ');
    report_.fail(mistake.sentence, std::nullopt,
                 std::string("try '") + program + (path.empty() ? "" : " ") + path + " --help'");
    return ExitStatus::Usage;
}

ExitStatus Tool::showVersion() {
    context_.output.write(std::string(program) + " " + version + "\n");
    return written(ExitStatus::Completed, {});
}

ExitStatus Tool::showHelp(AutoCli::NamespaceNode &node) {
    if (registration_.daemonMissing) {
        report_.warn(daemonSentence());
    }
    context_.output.write(escaped(helpOf(node, program, context_.width), Lines::Keep));
    return written(ExitStatus::Completed, {});
}

ExitStatus Tool::runCommand(AutoCli::Command &command, CommandLine const &line) {
    boost::shared_ptr<CallSpec::OutputSpec> const spec = command.GetOutputSpec();
    boost::shared_ptr<MetaObj::MetaObject> const schema = spec != nullptr ? spec->GetOutputType() : nullptr;
    std::string const named = settings_.format.value_or(command.GetDefaultOutputFormatter());
    Format const *const known = findFormat(named);
    Format const &format = known != nullptr ? *known : *findFormat("simple");
    report_.setMachine(format.isMachine);
    FormatSettings const formatting = formatSettings(command, schema);

    Outcome const outcome = work(command, line);
    if (cli_.status()) {
        bool const isTold = *cli_.status() == ExitStatus::Unwritten;
        return isTold ? ExitStatus::Unwritten : written(*cli_.status(), {});
    }
    std::string unheld; // why the format cannot hold the result
    auto const document = boost::dynamic_pointer_cast<MetaObj::MetaString>(outcome.result);
    if (document != nullptr && command.GetMetaDataField("document") == "true") {
        context_.output.write(document->GetValue()); // a text in a format of its own
    } else if (outcome.result != nullptr) {
        CountingSink counted(context_.output);
        std::chrono::microseconds const began = trace_.isEnabled() ? trace_.elapsed() : std::chrono::microseconds(0);
        try {
            format.write({outcome.result, schema}, formatting, trace_.isEnabled() ? counted : context_.output);
        } catch (FormatError const &error) {
            unheld = error.sentence();
        }
        if (trace_.isEnabled()) {
            Trace::Event(trace_, "output")
                .text("format", format.name)
                .number("bytes", counted.bytes())
                .duration("tookMs", trace_.elapsed() - began);
        }
    }
    tell(outcome);
    std::string const whatWasDone = outcome.status == ExitStatus::Completed ? "; the command itself was completed" : "";
    if (!unheld.empty()) {
        report_.fail(unheld + whatWasDone);
        return ExitStatus::Unwritten;
    }
    return written(outcome.status, whatWasDone);
}

Outcome Tool::work(AutoCli::Command &command, CommandLine const &line) {
    std::chrono::microseconds const began = trace_.isEnabled() ? trace_.elapsed() : std::chrono::microseconds(0);
    ProgressFunction const progress = context_.plugins.startProgress();
    if (context_.activity != nullptr) {
        // Traces and a line that is drawn over and over would be in each other's way; a conversation draws its own.
        bool const mayShow = !trace_.isEnabled() && command.GetMetaDataField("interactive") != "true";
        context_.activity->begin({progress, mayShow, report_.isMachine(), requestId_});
    }
    Outcome const outcome = call(command, line.input, context_.plugins); // never throws for what the command does
    if (context_.activity != nullptr) {
        context_.activity->end();
    }
    if (trace_.isEnabled()) {
        Trace::Event(trace_, "command")
            .number("status", static_cast<int64_t>(outcome.status))
            .number("code", outcome.cause ? outcome.cause->code : 0)
            .duration("tookMs", trace_.elapsed() - began);
    }
    return outcome;
}

FormatSettings Tool::formatSettings(AutoCli::Command &command,
                                    boost::shared_ptr<MetaObj::MetaObject> const &schema) const {
    FormatSettings formatting;
    formatting.setDisplay(context_.display);
    for (auto const &[key, value] : command.GetDefaultOutputFormatParameters()) {
        formatting.set(key, value);
    }
    for (std::string const &parameter : settings_.formatParameters) {
        formatting.setFromUser(parameter, schema);
    }
    if (settings_.fields) {
        boost::shared_ptr<MetaObj::MetaStruct> const structure = outermostStructure(schema);
        bool const declares = structure != nullptr;
        formatting.chooseFields(declares ? structure->GetName() : std::string(), *settings_.fields,
                                declares ? structure->GetFieldNames() : std::vector<std::string>());
    }
    return formatting;
}

/// Offline, a command hears only that no daemon answers; why there is no session was found out when plug-ins were
/// registered, and may be that this user may not use the socket.
std::optional<LastFailure> Tool::causeOf(Outcome const &outcome) const {
    bool const isOffline = registration_.daemonMissing && saysDaemonDead(outcome.cause);
    bool const wasOther = registration_.daemonFailure && !saysDaemonDead(registration_.daemonFailure);
    return isOffline && wasOther ? registration_.daemonFailure : outcome.cause;
}

void Tool::tell(Outcome const &outcome) {
    bool const daemonDead = saysDaemonDead(outcome.cause);
    if (registration_.daemonMissing && !daemonDead) {
        report_.warn(daemonSentence());
    }
    std::optional<LastFailure> const cause = causeOf(outcome);
    if (outcome.status == ExitStatus::Completed) {
        if (cause) {
            report_.warn(cause->sentence); // swallowed by the command, which could do without
        }
        return;
    }
    std::string hint = cause ? hintFor(cause->code, settings_.root, requestId_) : std::string();
    if (daemonDead && !contains(outcome.message + cause->sentence, socketPath())) {
        hint = "its socket is " + socketPath() + (hint.empty() ? "" : "; ") + hint;
    }
    report_.fail(outcome.message, cause, hint);
}

std::string Tool::socketPath() const {
    return settings_.root + "/run/lumod.sock";
}

std::string Tool::startHint() const {
    return " (" + hintFor(static_cast<int32_t>(Wire::ErrorCode::DaemonNotRunning), settings_.root, requestId_) + ")";
}

std::string Tool::daemonSentence() const {
    std::optional<LastFailure> const &failure = registration_.daemonFailure;
    if (!failure || failure->sentence.empty()) {
        return "no daemon answers at " + socketPath() + startHint();
    }
    std::string const where = contains(failure->sentence, socketPath()) ? "" : " (" + socketPath() + ")";
    return failure->sentence + where + (saysDaemonDead(failure) ? startHint() : "");
}

ExitStatus Tool::written(ExitStatus status, std::string const &whatWasDone) {
    std::string const problem = context_.output.problem();
    if (problem.empty()) {
        return status;
    }
    report_.fail("cannot write the output: " + problem + whatWasDone);
    return ExitStatus::Unwritten;
}

} // namespace Tovicli
