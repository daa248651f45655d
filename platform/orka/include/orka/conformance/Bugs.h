// SPDX-License-Identifier: Apache-2.0
//
// Providers that break one promise each. They show that the conformance kit finds what it claims to find, and serve a
// host that wants to see how it copes. A bug is a decorator: it goes between a caller and a provider that is right.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <kj/timer.h>

#include "orka/Provider.h"

namespace Orka::Conformance {

struct Bug {
    char const *name;
    char const *description; ///< one sentence
    char const *caughtBy;    ///< the case of the kit that is there to find it
    std::unique_ptr<Provider> (*put)(std::unique_ptr<Provider> inner, kj::Timer &timer);
    /// What keeps the case from seeing the bug when the provider is served over HTTPS; null: it is seen there too.
    char const *hiddenOverHttps = nullptr;
};

/// All of them, in the order of the interface's operations.
std::vector<Bug> const &bugs();

/// Puts the bug of that name between the caller and `inner`.
/// @throws Wire::Failure InvalidArgument when there is none of that name.
std::unique_ptr<Provider> makeBuggy(std::string const &name, std::unique_ptr<Provider> inner, kj::Timer &timer);

} // namespace Orka::Conformance
