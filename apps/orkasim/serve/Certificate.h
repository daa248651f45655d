// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <string>
#include <vector>

namespace Orkasim {

/// A private key and the certificate that goes with it, both in PEM.
struct Identity {
    std::string certificate;
    std::string key;
};

/// Whom a certificate that we make speaks for, and for how long, both counted from now.
struct CertificateSpec {
    std::vector<std::string> names; ///< names and addresses of this host; the first is also the subject's
    std::chrono::seconds validFrom = std::chrono::hours(-1);
    std::chrono::seconds validUntil = std::chrono::hours(24 * 3650);
};

/// A new key, and a certificate signed by itself. @throws Wire::Failure InternalError
Identity makeIdentity(CertificateSpec const &spec);

/// Reads both files. @throws Wire::Failure IoError
Identity readIdentity(std::string const &certificatePath, std::string const &keyPath);

/// Writes both files; the key so that only its owner can read it. @throws Wire::Failure IoError
void writeIdentity(Identity const &identity, std::string const &certificatePath, std::string const &keyPath);

/// Writes a file whole: under another name, and renamed as the last step. @throws Wire::Failure IoError
void writeFile(std::string const &path, std::string const &content, unsigned mode);

} // namespace Orkasim
