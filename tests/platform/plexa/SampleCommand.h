// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include <boost/make_shared.hpp>

#include "plexa/AutoCli.h"

/// A command whose declaration and behaviour a test sets.
class SampleCommand : public virtual Plexa::AutoCli::Command {
public:
    static boost::shared_ptr<SampleCommand> New() {
        return boost::make_shared<SampleCommand>();
    }

    boost::shared_ptr<Plexa::CallSpec::ParameterSpec> parameter(std::string const &name,
                                                                Plexa::CallSpec::ParameterType type,
                                                                std::string const &alias = "",
                                                                std::string const &description = "") {
        auto const made = Plexa::CallSpec::ParameterSpec::New(name, type);
        made->SetAlias(alias);
        made->SetDescription(description);
        input->AddParameter(made);
        return made;
    }

    boost::shared_ptr<Plexa::CallSpec::InputSpec> GetInputSpecInternal() override {
        return input;
    }
    boost::shared_ptr<Plexa::CallSpec::OutputSpec> GetOutputSpecInternal() override {
        return output;
    }
    void ExecuteInternal(boost::shared_ptr<Plexa::CallSpec::Input> const &arguments,
                         boost::shared_ptr<Plexa::CallSpec::Output> const &left) override {
        ++executions;
        if (behaviour) {
            behaviour(*arguments, *left);
        }
    }

    boost::shared_ptr<Plexa::CallSpec::InputSpec> input = Plexa::CallSpec::InputSpec::New();
    boost::shared_ptr<Plexa::CallSpec::OutputSpec> output = Plexa::CallSpec::OutputSpec::New();
    std::function<void(Plexa::CallSpec::Input const &, Plexa::CallSpec::Output &)> behaviour;
    int executions = 0;
};
