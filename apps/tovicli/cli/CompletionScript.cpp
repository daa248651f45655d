// SPDX-License-Identifier: Apache-2.0
#include "CompletionScript.h"

#include "Commands.h"
#include "completion/Scripts.h"
#include "plexa/UsageError.h"

using namespace Plexa;

namespace Tovicli::Cli {

CompletionScript::CompletionScript(CliServices &services)
    : CliCommand(services) {
    SetDescription("Print the completion script of a shell, made from what every command declares.");
    SetMetaDataField("positional", "shell");
    SetMetaDataField("document", "true");
    AddExample("cli completion bash", "For bash: source <(tovicli cli completion bash)");
    AddExample("cli completion fish", "For fish: tovicli cli completion fish | source");
}

InputSpecPtr CompletionScript::GetInputSpecInternal() {
    return declareParameters({
        {"shell", CallSpec::String, true, "bash, zsh or fish; --shell may be left out."},
    });
}

OutputSpecPtr CompletionScript::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaString::New());
}

void CompletionScript::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::string const shell = input->GetString("shell");
    std::string (*write)(std::vector<NodeEntry> const &table) = shell == "bash"   ? bashScript
                                                                : shell == "zsh"  ? zshScript
                                                                : shell == "fish" ? fishScript
                                                                                  : nullptr;
    if (write == nullptr) {
        throw UsageError("--shell: " + shownWord(shell) + " is no shell that is known here; there is bash, zsh, fish");
    }
    growAndWarn(services_);
    output->SetResult(MetaObj::MetaString::New(write(completionTable(*services_.root()))));
    output->Complete();
}

} // namespace Tovicli::Cli
