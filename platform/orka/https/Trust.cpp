// SPDX-License-Identifier: Apache-2.0
#include "https/Trust.h"

#include <cerrno>
#include <fstream>
#include <iterator>
#include <string_view>
#include <system_error>

#include <sys/stat.h>

#include <kj/vector.h>

#include "wire/Failure.h"

namespace Orka::Https {

namespace {

constexpr std::string_view endOfCertificate = "-----END CERTIFICATE-----";
constexpr int64_t fileBytesMax = int64_t{1} << 20;

Wire::Failure malformed(std::string const &path) {
    return {Wire::ErrorCode::FileMalformed, "the pinned certificate '" + path + "' is no certificate in PEM"};
}

/// Each certificate of the file by itself: the library trusts only the first of several that come in one text.
kj::Vector<kj::TlsCertificate> certificatesIn(std::string const &path, std::string_view text) {
    kj::Vector<kj::TlsCertificate> certificates;
    for (auto end = text.find(endOfCertificate); end != std::string_view::npos; end = text.find(endOfCertificate)) {
        end += endOfCertificate.size();
        auto const one = kj::heapString(text.data(), end);
        auto const failed = kj::runCatchingExceptions([&] { certificates.add(kj::TlsCertificate(one.asPtr())); });
        if (failed != nullptr) {
            throw malformed(path);
        }
        text.remove_prefix(end);
    }
    if (certificates.empty()) {
        throw malformed(path);
    }
    return certificates;
}

std::string contentOf(std::string const &path) {
    std::ifstream file(path, std::ios::binary);
    std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    if (!file) {
        throw Wire::Failure(Wire::ErrorCode::IoError, "the pinned certificate '" + path + "' cannot be read");
    }
    return text;
}

} // namespace

Trust::Trust(std::string const &directory, Url const &url)
    : host_(url.host) {
    if (!directory.empty()) {
        path_ = directory + '/' + url.host + '_' + std::to_string(url.port) + ".pem";
    }
}

std::optional<Trust::Stamp> Trust::stampOfFile() const {
    struct stat status {};
    if (path_.empty()) {
        return std::nullopt;
    }
    if (::stat(path_.c_str(), &status) != 0) {
        if (errno == ENOENT || errno == ENOTDIR) {
            return std::nullopt;
        }
        // Falling back to the system's store would trust more than was asked for.
        throw Wire::Failure(Wire::ErrorCode::IoError, "the pinned certificate '" + path_ + "' cannot be read: " +
                                                          std::generic_category().message(errno));
    }
    if (!S_ISREG(status.st_mode) || status.st_size > fileBytesMax) {
        throw malformed(path_);
    }
    return Stamp{status.st_ino, status.st_size, status.st_mtim.tv_sec, status.st_mtim.tv_nsec};
}

kj::Promise<kj::Own<kj::AsyncIoStream>> Trust::secure(kj::Own<kj::AsyncIoStream> stream) {
    return context().wrapClient(kj::mv(stream), host_.c_str());
}

std::string Trust::advice() const {
    if (path_.empty()) {
        return "";
    }
    return stamp_ ? "'" + path_ + "' does not vouch for it" : "it would have to be pinned in '" + path_ + "'";
}

kj::TlsContext &Trust::context() {
    auto const stamp = stampOfFile();
    if (context_ && stamp == stamp_) {
        return *context_;
    }
    kj::TlsContext::Options options;
    options.minVersion = kj::TlsVersion::TLS_1_2;
    kj::Vector<kj::TlsCertificate> pinned;
    if (stamp) {
        pinned = certificatesIn(path_, contentOf(path_));
        options.useSystemTrustStore = false;
        options.trustedCertificates = pinned;
    }
    context_ = std::make_unique<kj::TlsContext>(options);
    stamp_ = stamp;
    return *context_;
}

} // namespace Orka::Https
