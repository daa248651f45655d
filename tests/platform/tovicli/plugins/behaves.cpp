// SPDX-License-Identifier: Apache-2.0
//
// Registers "storage sample" with commands that show what the process around them is like.
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fcntl.h>
#include <unistd.h>

#include <boost/make_shared.hpp>

#include "plexa/AutoCli.h"

namespace {

using namespace Plexa;

class Plain : public virtual AutoCli::Command {
public:
    boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override {
        return CallSpec::InputSpec::New();
    }
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
        auto const spec = CallSpec::OutputSpec::New();
        spec->SetOutputType(MetaObj::MetaInt::New());
        return spec;
    }
};

/// The number of the next free descriptor.
class NextDescriptor : public virtual Plain {
public:
    void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &,
                         boost::shared_ptr<CallSpec::Output> const &output) override {
        int const opened = open("/dev/null", O_RDONLY | O_CLOEXEC);
        output->SetMessage("next free descriptor " + std::to_string(opened));
        close(opened);
    }
};

/// Is interrupted while it works.
class Interrupt : public virtual Plain {
public:
    void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &,
                         boost::shared_ptr<CallSpec::Output> const &output) override {
        raise(SIGINT);
        output->SetMessage("survived");
    }
};

/// Works until somebody writes into the pipe that TEST_PIPE names; answers whether that went undisturbed.
class Wait : public virtual Plain {
public:
    void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &,
                         boost::shared_ptr<CallSpec::Output> const &output) override {
        int const pipe = open(getenv("TEST_PIPE"), O_RDONLY | O_CLOEXEC);
        char byte = 0;
        bool const read = ::read(pipe, &byte, 1) == 1;
        close(pipe);
        output->SetResult(MetaObj::MetaInt::New(read ? 7 : 0));
        output->Complete();
    }
};

/// Answers 42.
class Answer : public virtual Plain {
public:
    void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &,
                         boost::shared_ptr<CallSpec::Output> const &output) override {
        output->SetResult(MetaObj::MetaInt::New(42));
        output->Complete();
    }
};

/// Answers 42 and prints by itself, into a buffer of the process.
class Print : public virtual Answer {
public:
    void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &input,
                         boost::shared_ptr<CallSpec::Output> const &output) override {
        std::printf("printed without the tool\n");
        Answer::ExecuteInternal(input, output);
    }
};

} // namespace

void AutoCli_RegisterNamespaces(boost::shared_ptr<AutoCli::Namespace> &root) {
    auto const sample = root->SubNamespace("storage")->SubNamespace("sample");
    sample->RegisterNamespaceNode(boost::make_shared<NextDescriptor>(), "descriptor");
    sample->RegisterNamespaceNode(boost::make_shared<Interrupt>(), "interrupt");
    sample->RegisterNamespaceNode(boost::make_shared<Answer>(), "answer");
    sample->RegisterNamespaceNode(boost::make_shared<Print>(), "print");
    sample->RegisterNamespaceNode(boost::make_shared<Wait>(), "wait");
}
