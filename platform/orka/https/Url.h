// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace Orka::Https {

/// Where a provider is reached, taken apart.
struct Url {
    std::string host; ///< a name or an address, without brackets
    uint16_t port = 443;
    std::string path; ///< what stands before the version in every operation's path; no slash at its end

    /// host:port, an IPv6 address in brackets: what connections are made to and failures name.
    std::string authority() const;
};

/// https://HOST[:PORT][/PATH]
/// @throws Wire::Failure InvalidArgument with what is wrong with it
Url parseUrl(std::string const &text);

} // namespace Orka::Https
