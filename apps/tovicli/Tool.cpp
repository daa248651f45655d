// SPDX-License-Identifier: Apache-2.0
#include "Tool.h"

#include <exception>

#include "plexa/Text.h"
#include "plexa/TreeHelp.h"
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
    for (char const *name :
         {"TOVI_FORMAT", "TOVI_LOG_LEVEL", "TOVI_OFFLINE", "TOVI_PLUGINS", "TOVI_ROOT", "TOVI_TIMEOUT_MS"}) {
        if (std::optional<std::string> const value = environment.get(name)) {
            copy.set(name, *value);
        }
    }
    return copy;
}

std::string withoutLineEnd(std::string text) {
    if (text.ends_with('\n')) {
        text.pop_back();
    }
    return text;
}

bool contains(std::string const &text, std::string const &part) {
    return text.find(part) != std::string::npos;
}

bool saysDaemonDead(std::optional<LastFailure> const &cause) {
    return cause && cause->code == static_cast<int32_t>(Wire::ErrorCode::DaemonNotRunning);
}

} // namespace

Tool::Tool(Context &context)
    : context_(context)
    , report_(context.errors) {}

ExitStatus Tool::run(std::vector<std::string> const &arguments) {
    try {
        if (arguments.empty()) {
            throw UsageError("the argument list is empty, the program's name is expected first");
        }
        std::vector<std::string> const words(arguments.begin() + 1, arguments.end());
        checkWords(words);
        return runWords(words);
    } catch (UsageError const &mistake) {
        report_.fail(mistake.sentence(), std::nullopt, "try 'tovicli --help'");
        return ExitStatus::Usage;
    } catch (std::exception const &failure) { // memory, or a command that cannot even describe itself
        report_.fail(failure.what());
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
    try {
        settings = settingsFrom(*reading.probable, environment, context_.defaults);
    } catch (UsageError const &) {
        // May be a command's value of its own; the full reading decides.
    }
    offlineByUser_ = original.get("TOVI_OFFLINE").has_value();
    Root root = grow(settings);
    Misread mistake;
    CommandLine line = readCommandLine(root, words, mistake);
    Settings full = settings_;
    if (mistake.sentence.empty()) {
        full = settingsFrom(*line.global, environment, context_.defaults);
        if (!full.servesSamePlugins(settings_)) {
            // What looked like a global option was a value of the command's: begin again under the right settings.
            line = CommandLine();
            root = grow(full);
            line = readCommandLine(root, words, mistake);
        }
    }
    apply(full);
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

Tool::Root Tool::grow(Settings const &settings) {
    apply(settings);
    if (!offlineByUser_) {
        context_.environment.unset("TOVI_OFFLINE");
    }
    Root root = AutoCli::Namespace::New();
    auto const storage = AutoCli::Namespace::New();
    storage->SetDescription("Storage commands.");
    root->RegisterNamespaceNode(storage, "storage");
    registration_ = context_.plugins.registerInto(root, settings.pluginDirectory, context_.environment);
    return root;
}

void Tool::apply(Settings const &settings) {
    settings_ = settings;
    if (requestId_.empty()) {
        requestId_ = context_.newRequestId();
    }
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
    auto *const command = dynamic_cast<AutoCli::Command *>(&node);
    std::string help = command != nullptr ? commandHelpText(*command, program, context_.width)
                                          : namespaceHelp(node, program, context_.width);
    if (node.GetParent() == nullptr) {
        help += globalOptionsHelp(*globalOptions(), context_.width);
    } else {
        help += std::string("\nGlobal options: ") + program + " --help\n";
    }
    context_.output.write(escaped(help, Lines::Keep));
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

    Outcome const outcome = call(command, line.input, context_.plugins);
    if (outcome.result != nullptr) {
        format.write({outcome.result, schema}, formatting, context_.output);
    }
    tell(outcome);
    return written(outcome.status, outcome.status == ExitStatus::Completed ? "; the command itself was completed" : "");
}

FormatSettings Tool::formatSettings(AutoCli::Command &command,
                                    boost::shared_ptr<MetaObj::MetaObject> const &schema) const {
    FormatSettings formatting;
    for (auto const &[key, value] : command.GetDefaultOutputFormatParameters()) {
        formatting.set(key, value);
    }
    for (std::string const &parameter : settings_.formatParameters) {
        formatting.setFromUser(parameter);
    }
    if (settings_.fields) {
        boost::shared_ptr<MetaObj::MetaStruct> const structure = outermostStructure(schema);
        bool const declares = structure != nullptr;
        formatting.chooseFields(declares ? structure->GetName() : std::string(), *settings_.fields,
                                declares ? structure->GetFieldNames() : std::vector<std::string>());
    }
    return formatting;
}

void Tool::tell(Outcome const &outcome) {
    bool const daemonDead = saysDaemonDead(outcome.cause);
    if (registration_.daemonMissing && !daemonDead) {
        report_.warn(daemonSentence());
    }
    if (outcome.status == ExitStatus::Completed) {
        if (outcome.cause) {
            report_.warn(outcome.cause->sentence); // swallowed by the command, which could do without
        }
        return;
    }
    std::string message = outcome.message;
    if (daemonDead && !report_.isMachine()) {
        // One line instead of message, cause and warning, which would say the same three times.
        message = withoutLineEnd(message);
        std::string const &sentence = outcome.cause->sentence;
        if (!contains(message, sentence)) {
            message += (message.ends_with('.') ? " " : ": ") + sentence;
        }
        message += contains(message, socketPath()) ? "" : " (" + socketPath() + ")";
        message += startHint();
    }
    report_.fail(message, outcome.cause);
}

std::string Tool::socketPath() const {
    return settings_.root + "/run/lumod.sock";
}

std::string Tool::startHint() const {
    return "; start it with 'lumod --root " + settings_.root + "'";
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
