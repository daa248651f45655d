// SPDX-License-Identifier: Apache-2.0
#include "Channel.h"

#include <arpa/inet.h>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <netinet/tcp.h>
#include <openssl/err.h>
#include <openssl/ssl.h>
#include <stdexcept>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>
#include <utility>

namespace Bench {

namespace {

[[noreturn]] void failWithTls(std::string const &what) {
    char reason[200] = "no reason told";
    if (unsigned long const code = ERR_get_error(); code != 0) {
        ERR_error_string_n(code, reason, sizeof(reason));
    }
    throw std::runtime_error(what + ": " + reason);
}

void waitNoMore(int fd) {
    if (fcntl(fd, F_SETFL, fcntl(fd, F_GETFL) | O_NONBLOCK) != 0) {
        failWithErrno("a socket that does not wait");
    }
}

} // namespace

void failWithErrno(std::string const &what) {
    throw std::runtime_error(what + ": " + std::strerror(errno));
}

TlsSettings::TlsSettings(bool isServer)
    : context_(SSL_CTX_new(isServer ? TLS_server_method() : TLS_client_method()))
    , isServer_(isServer) {
    if (context_ == nullptr) {
        failWithTls("TLS");
    }
}

TlsSettings::~TlsSettings() {
    SSL_CTX_free(context_);
}

std::shared_ptr<TlsSettings const> TlsSettings::client() {
    return std::make_shared<TlsSettings const>(false);
}

std::shared_ptr<TlsSettings const> TlsSettings::server(std::string const &certificate, std::string const &key) {
    auto settings = std::make_shared<TlsSettings>(true);
    if (SSL_CTX_use_certificate_chain_file(settings->context(), certificate.c_str()) != 1 ||
        SSL_CTX_use_PrivateKey_file(settings->context(), key.c_str(), SSL_FILETYPE_PEM) != 1) {
        failWithTls(certificate + " and " + key);
    }
    return settings;
}

Channel::Channel(int fd, TlsSettingsPtr tls)
    : fd_(fd)
    , tls_(std::move(tls)) {
    if (tls_) {
        int const yes = 1;
        setsockopt(fd_, IPPROTO_TCP, TCP_NODELAY, &yes, sizeof(yes));
        ssl_ = SSL_new(tls_->context());
        if (ssl_ == nullptr || SSL_set_fd(ssl_, fd_) != 1) {
            failWithTls("a TLS connection");
        }
        if (tls_->isServer()) {
            SSL_set_accept_state(ssl_);
        } else if (SSL_connect(ssl_) != 1) {
            failWithTls("the TLS handshake");
        }
    }
    waitNoMore(fd_);
}

Channel::~Channel() {
    SSL_free(ssl_);
    close(fd_);
}

void Channel::send(std::vector<std::byte> const &message) {
    ssize_t const sent = ssl_ == nullptr ? ::send(fd_, message.data(), message.size(), MSG_NOSIGNAL)
                                         : SSL_write(ssl_, message.data(), static_cast<int>(message.size()));
    if (sent != static_cast<ssize_t>(message.size())) {
        throw std::runtime_error("a message could not be sent at once");
    }
}

size_t Channel::receive(std::vector<std::byte> &buffer) {
    if (ssl_ != nullptr) {
        return receiveSecured(buffer);
    }
    ssize_t const got = recv(fd_, buffer.data(), buffer.size(), 0);
    if (got < 0 && (errno == EAGAIN || errno == EINTR)) {
        return 0;
    }
    isOver_ = got <= 0;
    return got < 0 ? 0 : static_cast<size_t>(got);
}

size_t Channel::receiveSecured(std::vector<std::byte> &buffer) {
    int const got = SSL_read(ssl_, buffer.data(), static_cast<int>(buffer.size()));
    if (got > 0) {
        return static_cast<size_t>(got);
    }
    int const reason = SSL_get_error(ssl_, got);
    isOver_ = reason != SSL_ERROR_WANT_READ && reason != SSL_ERROR_WANT_WRITE;
    return 0;
}

int Address::connect() const {
    sockaddr_storage address{};
    socklen_t size = 0;
    if (isPath()) {
        auto &unixAddress = reinterpret_cast<sockaddr_un &>(address);
        unixAddress.sun_family = AF_UNIX;
        if (text.size() >= sizeof(unixAddress.sun_path)) {
            throw std::runtime_error(text + " is too long for a socket");
        }
        std::memcpy(unixAddress.sun_path, text.c_str(), text.size() + 1);
        size = sizeof(unixAddress);
    } else {
        auto &internet = reinterpret_cast<sockaddr_in &>(address);
        auto const colon = text.rfind(':');
        internet.sin_family = AF_INET;
        internet.sin_port = htons(static_cast<uint16_t>(std::stoul(text.substr(colon + 1))));
        if (inet_pton(AF_INET, text.substr(0, colon).c_str(), &internet.sin_addr) != 1) {
            throw std::runtime_error(text + " is no address");
        }
        size = sizeof(internet);
    }
    int const fd = socket(address.ss_family, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd < 0 || ::connect(fd, reinterpret_cast<sockaddr const *>(&address), size) != 0) {
        failWithErrno("cannot connect to " + text);
    }
    return fd;
}

} // namespace Bench
