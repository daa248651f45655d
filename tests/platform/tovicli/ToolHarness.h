// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include "SampleCommand.h"
#include "Tool.h"

/// Subtrees made by the test, where the real tool loads them.
class TestPlugins : public Tovicli::PluginSource {
public:
    Tovicli::Registration registerInto(boost::shared_ptr<Plexa::AutoCli::Namespace> &root, std::string const &directory,
                                       Tovicli::Environment &environment) override {
        directories.push_back(directory);
        roots.push_back(environment.get("TOVI_ROOT").value_or(""));
        if (registration.daemonMissing) {
            environment.set("TOVI_OFFLINE", "1");
        }
        if (grow) {
            grow(*root);
        }
        return registration;
    }
    std::optional<Tovicli::LastFailure> lastFailure() override {
        return failure;
    }
    void clearLastFailure() override {
        failure.reset();
    }
    Tovicli::ProgressFunction startProgress() override {
        return progress;
    }
    void traceRequests(std::function<void(Tovicli::RequestDone const &)> newReceiver) override {
        receiver = std::move(newReceiver);
    }

    std::function<void(Plexa::AutoCli::Namespace &root)> grow;
    Tovicli::Registration registration;
    std::optional<Tovicli::LastFailure> failure;
    Tovicli::ProgressFunction progress = nullptr;
    std::function<void(Tovicli::RequestDone const &)> receiver;
    std::vector<std::string> directories; ///< one each time that plug-ins were registered, and likewise:
    std::vector<std::string> roots;
};

/// A sink that takes so much and then fails.
class FailingSink : public Plexa::Sink {
public:
    void write(std::string_view) override {
        failed_ = true;
    }
    std::string problem() const override {
        return failed_ ? "No space left on device" : "";
    }

private:
    bool failed_ = false;
};

/// A whole run of the tool on a tree with one command, "storage sample".
struct ToolHarness {
    boost::shared_ptr<SampleCommand> command = SampleCommand::New();
    TestPlugins plugins;
    Tovicli::MapEnvironment environment;
    bool privileged = false;
    Tovicli::Activity *activity = nullptr;
    Tovicli::Trace::Clock clock = {};
    std::string output;
    std::string errors;

    ToolHarness() {
        plugins.grow = [this](Plexa::AutoCli::Namespace &root) {
            command->SetParent(nullptr); // moves from the tree of the registration before
            root.GetNamespaceNode("storage")->RegisterNamespaceNode(command, "sample");
        };
    }

    /// @return the exit status
    int run(std::vector<std::string> words) {
        words.insert(words.begin(), "tovicli");
        return runArguments(words);
    }
    int runArguments(std::vector<std::string> const &arguments) {
        Plexa::StringSink sink;
        int const status = runInto(sink, arguments);
        output = sink.text();
        return status;
    }
    int runInto(Plexa::Sink &sink, std::vector<std::string> const &arguments) {
        Plexa::StringSink errorSink;
        Tovicli::Context context{
            sink, errorSink,  environment, plugins, [] { return std::string("request-1"); }, {"/plugins", "/cwd"},
            80,   privileged, activity,    clock};
        auto const status = Tovicli::Tool(context).run(arguments);
        errors = errorSink.text();
        return static_cast<int>(status);
    }
};
