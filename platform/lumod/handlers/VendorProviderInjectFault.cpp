// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <fmt/format.h>

namespace Lumod {

namespace {

constexpr std::string_view takesBack = "default";

ProviderSet::Injection injectionOf(Wire::VendorProviderInjectFault::Reader request) {
    ProviderSet::Injection injection;
    std::string const status = textOf(request.getStatus());
    if (status != takesBack) {
        injection.status = providerStatusNamed(status);
        if (!injection.status) {
            throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                                fmt::format("'{}' is no provider status; those are online, offline, syncError, "
                                            "unknown, and default to take an injection back",
                                            status));
        }
    }
    for (Wire::VendorProviderInjectFault::ArrayFault::Reader const fault : request.getArrays()) {
        injection.flags[textOf(fault.getArrayId())] = fault.getIsActive();
    }
    return injection;
}

void requireUrl(ProviderEntry const &provider, std::string const &url) {
    if (!url.empty() && url != provider.record.url) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchProvider,
                            fmt::format("the provider '{}' is registered with the URL {}, not {}", provider.record.name,
                                        provider.record.url, url));
    }
}

} // namespace

Answer<ReplyPtr> vendorProviderInjectFault(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::VendorProviderInjectFault::Reader const wanted = request.getVendorProviderInjectFault();
    ProviderSet::Injection injection = injectionOf(wanted);
    std::string name = textOf(wanted.getProviderName());
    std::string url = textOf(wanted.getProviderUrl());
    // No provider is asked: an injection works for one that does not answer, too.
    return andThen(core.host.current(call), [&core, call, injection = std::move(injection), name = std::move(name),
                                             url = std::move(url)](std::shared_ptr<HostSnapshot const>) {
        ProviderPtr const provider = core.providers.named(name);
        requireUrl(*provider, url);
        for (auto const &flag : injection.flags) {
            if (!provider->mayServe(flag.first)) {
                throw Wire::Failure(Wire::ErrorCode::NoSuchArray,
                                    fmt::format("the provider '{}' has no storage array '{}'", name, flag.first));
            }
        }
        core.providers.inject(*provider, injection);
        core.log.write(LogLevel::Warning, call->trace,
                       fmt::format("injected into the provider '{}': status {}, {} array flags", name,
                                   injection.status ? nameOf(*injection.status) : takesBack.data(),
                                   injection.flags.size()));
        return doneReply();
    });
}

} // namespace Lumod
