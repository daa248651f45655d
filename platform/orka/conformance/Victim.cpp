// SPDX-License-Identifier: Apache-2.0
#include "orka/conformance/Victim.h"

#include <string_view>

#include <unistd.h>

#include "conformance/Show.h"

namespace Orka::Conformance {

namespace {

using Words = std::vector<std::string>;

/// Whole or not at all; whoever reads it may be gone.
bool say(std::string const &line) {
    auto const text = line + '\n';
    return write(STDOUT_FILENO, text.data(), text.size()) == static_cast<ssize_t>(text.size());
}

Outcome<Done> perform(Provider &provider, CallContext context, Words const &words, kj::WaitScope &scope) {
    auto const &operation = words[1];
    if (operation == "create" && words.size() == 4) {
        VolumeSpec spec;
        spec.containerId = words[2];
        spec.directoryName = words[3];
        auto const made = provider.createVirtualVolume(std::move(context), std::move(spec)).wait(scope);
        return made.ok() ? Outcome<Done>(Done{}) : Outcome<Done>(made.failure());
    }
    if (operation == "delete" && words.size() == 4) {
        return provider.deleteVirtualVolume(std::move(context), words[2], words[3]).wait(scope);
    }
    if (operation == "bind" && words.size() == 5) {
        return provider.bindVirtualVolume(std::move(context), words[2], words[3], words[4]).wait(scope);
    }
    if (operation == "unbind" && words.size() == 4) {
        return provider.unbindVirtualVolume(std::move(context), words[2], words[3]).wait(scope);
    }
    return Wire::Failure(Wire::ErrorCode::InvalidArgument, "there is no such mutation");
}

} // namespace

int actAsVictim(Words const &words,
                std::function<std::unique_ptr<Provider>(kj::Timer &, kj::Network &)> const &connect) {
    if (words.size() < 2) {
        return 1;
    }
    auto io = kj::setupAsyncIo();
    auto &timer = io.provider->getTimer();
    auto const provider = connect(timer, io.provider->getNetwork());
    if (!say("begun")) {
        return 1;
    }
    CallContext context{timer.now() + 30 * kj::SECONDS, std::nullopt, words[0]};
    auto const outcome = perform(*provider, std::move(context), words, io.waitScope);
    if (!say(outcome.ok() ? "answered" : show(outcome.failure())) || !outcome.ok()) {
        return 1;
    }
    char byte = 0;
    while (read(STDIN_FILENO, &byte, 1) > 0) {
    }
    return 0;
}

} // namespace Orka::Conformance
