// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

#include "ProviderArrays.h"

namespace Lumod {

Answer<ReplyPtr> deactivateProvider(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::DeactivateProvider::Reader const wanted = request.getDeactivateProvider();
    std::string arrayId = textOf(wanted.getArrayId());
    std::string providerName = textOf(wanted.getProviderName());
    return andThen(core.surveyor.survey(call), [&core, call, arrayId = std::move(arrayId),
                                                providerName = std::move(providerName)](Survey survey) {
        ProviderPtr const provider = core.providers.named(providerName);
        requireArray(survey, *provider, arrayId);
        core.providers.deactivate(*provider, arrayId);
        core.log.write(LogLevel::Info, call->trace,
                       fmt::format("deactivated the provider '{}' for the storage array {}", providerName, arrayId));
        return doneReply();
    });
}

} // namespace Lumod
