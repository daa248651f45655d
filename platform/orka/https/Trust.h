// SPDX-License-Identifier: Apache-2.0
//
// Whose certificates a provider may show. Without more it is whoever the system trusts. Where a file is pinned for the
// provider, CERTIFICATES/HOST_PORT.pem, only what stands in that file is trusted, and the system's store is not asked.
// A file that appears, changes or goes counts from the next connection on. The certificate must name the URL's host
// either way.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include <kj/async-io.h>
#include <kj/compat/tls.h>

#include "https/Url.h"

namespace Orka::Https {

class Trust {
public:
    /// @param directory where pinned certificates are; empty: none are
    Trust(std::string const &directory, Url const &url);

    /// TLS over a connection to the provider; rejected when its certificate is not to be trusted.
    /// @throws Wire::Failure FileMalformed when the pinned file holds no certificate, IoError when it cannot be read
    kj::Promise<kj::Own<kj::AsyncIoStream>> secure(kj::Own<kj::AsyncIoStream> stream);
    /// The next connection reads the system's store anew.
    void forget() {
        context_.reset();
    }
    /// What to look at when nobody that is trusted vouches for a certificate; empty when there is no place to pin one.
    std::string advice() const;

private:
    /// Tells one state of the pinned file from another.
    struct Stamp {
        uint64_t inode = 0;
        int64_t size = 0;
        int64_t seconds = 0;
        int64_t nanoseconds = 0;
        bool operator==(Stamp const &) const = default;
    };
    std::optional<Stamp> stampOfFile() const;
    kj::TlsContext &context();

    std::string host_;
    std::string path_;
    std::optional<Stamp> stamp_; ///< of the file that the context was made of; nothing: of the system's store
    std::unique_ptr<kj::TlsContext> context_;
};

} // namespace Orka::Https
