// SPDX-License-Identifier: Apache-2.0
#include "CliHost.h"

#include <dlfcn.h>
#include <utility>

#include "Tool.h"

namespace Tovicli {

using namespace Plexa;

namespace {

constexpr char const *name = "cli";

} // namespace

CliEntry cliLibrary(std::string path) {
    return [path = std::move(path)](boost::shared_ptr<AutoCli::NamespaceNode> const &cli, CliServices &services,
                                    bool completing) -> std::string {
        // Now, not lazily: a substitute for one of the platform's libraries lacks what this one needs of them.
        void *const library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
        void *const entry = library != nullptr ? dlsym(library, "Tovicli_RegisterCli") : nullptr;
        if (entry == nullptr) {
            char const *const text = dlerror();
            return std::string("the commands of '") + name +
                   "' cannot be loaded: " + (text != nullptr ? text : "unknown error");
        }
        reinterpret_cast<RegisterCli *>(entry)(cli, services, completing);
        return {};
    };
}

CliHost::CliHost(Context &context, ErrorReport &report, bool isLine)
    : context_(context)
    , report_(report)
    , isLine_(isLine) {}

CliHost::~CliHost() = default;

bool CliHost::isWanted(std::vector<std::string> const &path) {
    return !path.empty() && path[0] == name;
}

bool CliHost::isCompletion(std::vector<std::string> const &path) {
    return isWanted(path) && path.size() > 1 && path[1] == "complete";
}

std::string CliHost::hangInto(boost::shared_ptr<AutoCli::Namespace> const &root, Settings const &settings,
                              bool offlineByUser, std::vector<std::string> const &path) {
    if (!context_.cli) {
        return {};
    }
    boost::shared_ptr<AutoCli::NamespaceNode> const cli = root->SubNamespace(name);
    cli->SetDescription("The tool itself: its commands and plug-ins, completion, a shell, the host's health.");
    if (!isWanted(path)) {
        return {};
    }
    settings_ = settings;
    offlineByUser_ = offlineByUser;
    root_ = root;
    plugins_.reset();
    return context_.cli(cli, *this, isCompletion(path));
}

Settings const &CliHost::settings() const {
    return settings_;
}

std::string CliHost::version() const {
    return Tool::versionText();
}

bool CliHost::isOffline() const {
    return offlineByUser_;
}

bool CliHost::isPrivileged() const {
    return context_.privileged;
}

boost::shared_ptr<AutoCli::NamespaceNode> CliHost::root() {
    return root_.lock();
}

Registration const &CliHost::growPlugins() {
    if (!plugins_) {
        boost::shared_ptr<AutoCli::Namespace> root = root_.lock();
        context_.environment.set("TOVI_OFFLINE", "1");
        plugins_ = context_.plugins.registerInto(root, settings_.pluginDirectory, context_.environment);
    }
    return *plugins_;
}

void CliHost::warn(std::string const &text) {
    report_.warn(text);
}

Sink &CliHost::output() {
    return context_.output;
}

ExitStatus CliHost::runLine(std::vector<std::string> const &words) {
    if (!lines_) {
        lines_ = std::make_unique<Tool>(context_, Tool::Tree::Kept);
        // One for all lines: sessions that outlast a line name it to the daemon.
        requestId_ = context_.environment.get("TOVI_REQUEST_ID");
    }
    restoreEnvironment();
    std::vector<std::string> arguments{"tovicli"};
    arguments.insert(arguments.end(), words.begin(), words.end());
    ExitStatus const status = lines_->run(arguments);
    restoreEnvironment();
    return status;
}

/// A line's own settings hold for that line alone: this run's take the place of the user's variables.
void CliHost::restoreEnvironment() {
    Environment &environment = context_.environment;
    auto const put = [&environment](char const *variable, std::optional<std::string> const &value) {
        value ? environment.set(variable, *value) : environment.unset(variable);
    };
    put("TOVI_ROOT", settings_.root);
    put("TOVI_TIMEOUT_MS", std::to_string(settings_.timeoutMs));
    put("TOVI_LOG_LEVEL", settings_.logLevel);
    put("TOVI_FORMAT", settings_.format);
    put("TOVI_PLUGINS", settings_.pluginDirectory);
    put("TOVI_OFFLINE", offlineByUser_ ? std::optional<std::string>("1") : std::nullopt);
    put("TOVI_REQUEST_ID", requestId_);
}

bool CliHost::isLine() const {
    return isLine_;
}

ExitStatus CliHost::refuseLine(std::string const &sentence) {
    report_.fail(sentence);
    return ExitStatus::Usage;
}

void CliHost::endWith(ExitStatus status) {
    status_ = status;
}

} // namespace Tovicli
