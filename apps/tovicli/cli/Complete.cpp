// SPDX-License-Identifier: Apache-2.0
#include "Complete.h"

#include <algorithm>

#include "completion/Completer.h"
#include "plexa/Text.h"
#include "shell/Words.h"

using namespace Plexa;

namespace Tovicli::Cli {

namespace {

char const *nameOf(Completion::Kind kind) {
    switch (kind) {
    case Completion::Kind::Files:
        return "files";
    case Completion::Kind::Directories:
        return "directories";
    default:
        return "words";
    }
}

} // namespace

Complete::Complete(CliServices &services)
    : CliCommand(services) {
    SetDescription("Answer a shell that completes a word.");
    SetMetaDataField("document", "true");
}

InputSpecPtr Complete::GetInputSpecInternal() {
    return declareParameters({
        {"word", CallSpec::StringList, false, "A word of the line, the one to complete last."},
    });
}

OutputSpecPtr Complete::GetOutputSpecInternal() {
    return declareResult(MetaObj::MetaString::New());
}

void Complete::ExecuteInternal(InputPtr const &input, OutputPtr const &output) {
    std::vector<std::string> words = input->GetStringList("word");
    for (std::string &word : words) {
        word = splitUnfinished(word).current;
    }
    std::string const current = words.empty() ? std::string() : words.back();
    if (!words.empty()) {
        words.pop_back();
    }
    services_.growPlugins();
    LiveQuery query;
    query.root = services_.settings().root;
    query.offline = services_.isOffline();
    query.patience = std::min(query.patience, std::chrono::milliseconds(services_.settings().timeoutMs));
    Completion const completion = complete(services_.root(), query, liveValues, words, current);
    std::string text = nameOf(completion.kind);
    text += '\n';
    for (Candidate const &candidate : completion.candidates) {
        // A name that would act on the terminal, or break the line, cannot be typed either.
        if (escaped(candidate.value) == candidate.value) {
            text += candidate.value + '\t' + escaped(candidate.description) + '\n';
        }
    }
    output->SetResult(MetaObj::MetaString::New(text));
    output->Complete();
}

} // namespace Tovicli::Cli
