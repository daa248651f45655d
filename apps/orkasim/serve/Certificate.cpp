// SPDX-License-Identifier: Apache-2.0
#include "serve/Certificate.h"

#include <cerrno>
#include <cstdio>
#include <fstream>
#include <iterator>
#include <memory>
#include <system_error>

#include <arpa/inet.h>
#include <fcntl.h>
#include <openssl/bio.h>
#include <openssl/ec.h>
#include <openssl/evp.h>
#include <openssl/pem.h>
#include <openssl/rand.h>
#include <openssl/x509v3.h>
#include <unistd.h>

#include "wire/Failure.h"

namespace Orkasim {

namespace {

using Wire::ErrorCode;

struct Free {
    void operator()(EVP_PKEY *key) const {
        EVP_PKEY_free(key);
    }
    void operator()(X509 *certificate) const {
        X509_free(certificate);
    }
    void operator()(X509_EXTENSION *extension) const {
        X509_EXTENSION_free(extension);
    }
    void operator()(BIO *memory) const {
        BIO_free(memory);
    }
};
template <typename T>
using Owned = std::unique_ptr<T, Free>;

void require(bool worked) {
    if (!worked) {
        throw Wire::Failure(ErrorCode::InternalError, "the cryptographic library made no certificate");
    }
}

bool isAddress(std::string const &name) {
    unsigned char bytes[sizeof(in6_addr)];
    return ::inet_pton(AF_INET, name.c_str(), bytes) == 1 || ::inet_pton(AF_INET6, name.c_str(), bytes) == 1;
}

/// An address stands there as a name as well: clients exist that compare names only.
std::string alternativeNames(std::vector<std::string> const &names) {
    std::string text;
    for (auto const &name : names) {
        text += (text.empty() ? "DNS:" : ",DNS:") + name;
        if (isAddress(name)) {
            text += ",IP:" + name;
        }
    }
    return text;
}

void addExtension(X509 *certificate, int kind, std::string const &value) {
    X509V3_CTX context;
    X509V3_set_ctx_nodb(&context);
    X509V3_set_ctx(&context, certificate, certificate, nullptr, nullptr, 0);
    Owned<X509_EXTENSION> const extension(X509V3_EXT_conf_nid(nullptr, &context, kind, value.c_str()));
    require(extension != nullptr && X509_add_ext(certificate, extension.get(), -1) == 1);
}

std::string textOf(BIO *memory) {
    char *data = nullptr;
    auto const size = BIO_get_mem_data(memory, &data);
    return {data, static_cast<std::size_t>(size)};
}

Wire::Failure fileFailure(std::string const &path, char const *what) {
    return {ErrorCode::IoError, "'" + path + "' cannot be " + what + ": " + std::generic_category().message(errno)};
}

std::string contentOf(std::string const &path) {
    errno = 0;
    std::ifstream file(path, std::ios::binary);
    std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    if (!file) {
        throw fileFailure(path, "read");
    }
    return text;
}

} // namespace

Identity makeIdentity(CertificateSpec const &spec) {
    Owned<EVP_PKEY> const key(EVP_EC_gen("P-256"));
    Owned<X509> const certificate(X509_new());
    require(key != nullptr && certificate != nullptr);
    uint64_t serial = 0;
    require(RAND_bytes(reinterpret_cast<unsigned char *>(&serial), sizeof serial) == 1);
    auto *const name = X509_get_subject_name(certificate.get());
    auto const *const subject = reinterpret_cast<unsigned char const *>(spec.names.front().c_str());
    require(X509_set_version(certificate.get(), X509_VERSION_3) == 1 &&
            ASN1_INTEGER_set_uint64(X509_get_serialNumber(certificate.get()), serial >> 1) == 1 &&
            X509_gmtime_adj(X509_getm_notBefore(certificate.get()), spec.validFrom.count()) != nullptr &&
            X509_gmtime_adj(X509_getm_notAfter(certificate.get()), spec.validUntil.count()) != nullptr &&
            X509_set_pubkey(certificate.get(), key.get()) == 1 &&
            X509_NAME_add_entry_by_txt(name, "CN", MBSTRING_UTF8, subject, -1, -1, 0) == 1 &&
            X509_set_issuer_name(certificate.get(), name) == 1);
    addExtension(certificate.get(), NID_basic_constraints, "critical,CA:FALSE");
    addExtension(certificate.get(), NID_key_usage, "critical,digitalSignature");
    addExtension(certificate.get(), NID_ext_key_usage, "serverAuth");
    addExtension(certificate.get(), NID_subject_alt_name, alternativeNames(spec.names));
    require(X509_sign(certificate.get(), key.get(), EVP_sha256()) > 0);
    Owned<BIO> const certificateText(BIO_new(BIO_s_mem()));
    Owned<BIO> const keyText(BIO_new(BIO_s_mem()));
    require(certificateText != nullptr && keyText != nullptr &&
            PEM_write_bio_X509(certificateText.get(), certificate.get()) == 1 &&
            PEM_write_bio_PrivateKey(keyText.get(), key.get(), nullptr, nullptr, 0, nullptr, nullptr) == 1);
    return {textOf(certificateText.get()), textOf(keyText.get())};
}

Identity readIdentity(std::string const &certificatePath, std::string const &keyPath) {
    return {contentOf(certificatePath), contentOf(keyPath)};
}

void writeIdentity(Identity const &identity, std::string const &certificatePath, std::string const &keyPath) {
    writeFile(keyPath, identity.key, 0600);
    writeFile(certificatePath, identity.certificate, 0644);
}

void writeFile(std::string const &path, std::string const &content, unsigned mode) {
    auto const temporary = path + "." + std::to_string(::getpid());
    int const descriptor = ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode);
    if (descriptor < 0) {
        throw fileFailure(path, "written");
    }
    auto const written = ::write(descriptor, content.data(), content.size());
    bool const isWhole = written == static_cast<ssize_t>(content.size());
    if (::close(descriptor) != 0 || !isWhole || std::rename(temporary.c_str(), path.c_str()) != 0) {
        auto const failure = fileFailure(path, "written");
        ::unlink(temporary.c_str());
        throw failure;
    }
}

} // namespace Orkasim
