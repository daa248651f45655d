// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

struct ssl_ctx_st;
struct ssl_st;

namespace Bench {

/// Throws std::runtime_error: what was done, and the operating system's reason.
[[noreturn]] void failWithErrno(std::string const &what);

/// The keys and settings that the ends of TLS connections share. A client checks nobody's certificate: only time is
/// measured.
class TlsSettings {
public:
    static std::shared_ptr<TlsSettings const> client();
    /// @param certificate, key  files in PEM
    static std::shared_ptr<TlsSettings const> server(std::string const &certificate, std::string const &key);

    explicit TlsSettings(bool isServer);
    ~TlsSettings();
    TlsSettings(TlsSettings const &) = delete;
    TlsSettings &operator=(TlsSettings const &) = delete;
    ssl_ctx_st *context() const {
        return context_;
    }
    bool isServer() const {
        return isServer_;
    }

private:
    ssl_ctx_st *context_;
    bool isServer_;
};

using TlsSettingsPtr = std::shared_ptr<TlsSettings const>;

/// One end of a connection that never waits, with TLS or without. Owns its descriptor. Messages that are sent have to
/// fit into the socket's buffer: whoever measures sends one and waits for its answer.
class Channel {
public:
    /// @param tls empty: bytes go as they are. A client's handshake is done here, a server's while it reads.
    Channel(int fd, TlsSettingsPtr tls);
    ~Channel();
    Channel(Channel const &) = delete;
    Channel &operator=(Channel const &) = delete;

    int fd() const {
        return fd_;
    }
    /// @throws std::runtime_error when not all of it could be sent at once
    void send(std::vector<std::byte> const &message);
    /// Reads what is there, at most the buffer's size. @return bytes; 0: nothing now. Sets isOver() at the end.
    size_t receive(std::vector<std::byte> &buffer);
    bool isOver() const {
        return isOver_;
    }

private:
    size_t receiveSecured(std::vector<std::byte> &buffer);

    int fd_;
    TlsSettingsPtr tls_;
    ssl_st *ssl_ = nullptr;
    bool isOver_ = false;
};

/// Where a server listens: a path of a Unix socket, or "HOST:PORT" with an address of this machine.
struct Address {
    std::string text;
    bool isPath() const {
        return text.find('/') != std::string::npos;
    }
    /// A new descriptor that is connected, and does wait.
    int connect() const;
};

} // namespace Bench
