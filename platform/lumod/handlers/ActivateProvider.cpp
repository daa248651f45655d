// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

#include "ProviderArrays.h"

namespace Lumod {

namespace {

struct Wanted {
    std::string arrayId;
    std::string providerName;
    std::string activeUrl;
};

void requireActive(Survey const &survey, ProviderSet const &providers, Wanted const &wanted) {
    if (wanted.activeUrl.empty()) {
        return;
    }
    ProviderPtr const provider = activeFor(survey, providers, wanted.arrayId);
    std::string const active = provider ? provider->record.url : std::string();
    if (active != wanted.activeUrl) {
        throw Wire::Failure(Wire::ErrorCode::NotTheActiveProvider,
                            active.empty()
                                ? fmt::format("no provider is active for the storage array {}, so {} is not",
                                              wanted.arrayId, wanted.activeUrl)
                                : fmt::format("the active provider of the storage array {} is at {}, not at {}",
                                              wanted.arrayId, active, wanted.activeUrl));
    }
}

} // namespace

Answer<ReplyPtr> activateProvider(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::ActivateProvider::Reader const activation = request.getActivateProvider();
    Wanted wanted{textOf(activation.getArrayId()), textOf(activation.getProviderName()),
                  textOf(activation.getActiveProviderUrl())};
    return andThen(core.surveyor.survey(call), [&core, call, wanted = std::move(wanted)](Survey survey) {
        ProviderPtr const provider = core.providers.named(wanted.providerName);
        requireArray(survey, *provider, wanted.arrayId);
        requireActive(survey, core.providers, wanted);
        core.providers.activate(*provider, wanted.arrayId);
        core.log.write(
            LogLevel::Info, call->trace,
            fmt::format("activated the provider '{}' for the storage array {}", wanted.providerName, wanted.arrayId));
        return doneReply();
    });
}

} // namespace Lumod
