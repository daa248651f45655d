// SPDX-License-Identifier: Apache-2.0
//
// Registers "storage ask", which passes on what the daemon's client library answers.
#include <boost/make_shared.hpp>

#include "lumolib/LumoLib.h"
#include "plexa/AutoCli.h"

namespace {

using namespace Plexa;

class Ask : public virtual AutoCli::Command {
public:
    boost::shared_ptr<CallSpec::InputSpec> GetInputSpecInternal() override {
        return CallSpec::InputSpec::New();
    }
    boost::shared_ptr<CallSpec::OutputSpec> GetOutputSpecInternal() override {
        return CallSpec::OutputSpec::New();
    }
    void ExecuteInternal(boost::shared_ptr<CallSpec::Input> const &,
                         boost::shared_ptr<CallSpec::Output> const &output) override {
        output->SetMessage(LumoLib_Err2String(0));
    }
};

} // namespace

void AutoCli_RegisterNamespaces(boost::shared_ptr<AutoCli::Namespace> &root) {
    root->GetNamespaceNode("storage")->RegisterNamespaceNode(boost::make_shared<Ask>(), "ask");
}
