// SPDX-License-Identifier: Apache-2.0
#include "lumod/ServiceManager.h"

#include <array>
#include <charconv>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <string_view>
#include <system_error>

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <fmt/format.h>

#include "wire/Failure.h"

namespace Lumod {

namespace {

constexpr int firstPassed = 3;
constexpr int passedMax = 16;

/// The path that a listening stream socket is bound to; empty for anything else.
std::string boundPath(int socket) {
    int type = 0;
    int listens = 0;
    socklen_t size = sizeof type;
    if (::getsockopt(socket, SOL_SOCKET, SO_TYPE, &type, &size) != 0 || type != SOCK_STREAM) {
        return {};
    }
    size = sizeof listens;
    if (::getsockopt(socket, SOL_SOCKET, SO_ACCEPTCONN, &listens, &size) != 0 || listens == 0) {
        return {};
    }
    sockaddr_un address{};
    size = sizeof address;
    if (::getsockname(socket, reinterpret_cast<sockaddr *>(&address), &size) != 0 || address.sun_family != AF_UNIX ||
        size <= offsetof(sockaddr_un, sun_path)) {
        return {};
    }
    std::size_t const room = size - offsetof(sockaddr_un, sun_path);
    return std::string(address.sun_path, ::strnlen(address.sun_path, room));
}

std::string_view lastPart(std::string_view path) {
    std::size_t const slash = path.rfind('/');
    return slash == std::string_view::npos ? path : path.substr(slash + 1);
}

/// 0 for what is absent or no number.
int numberOf(char const *variable) {
    char const *const text = std::getenv(variable);
    int number = 0;
    if (text == nullptr) {
        return 0;
    }
    auto const end = text + std::strlen(text);
    auto const result = std::from_chars(text, end, number);
    return result.ec == std::errc() && result.ptr == end ? number : 0;
}

int passedCount() {
    return numberOf("LISTEN_PID") == ::getpid() ? numberOf("LISTEN_FDS") : 0;
}

} // namespace

PassedSockets takePassedSockets(Wire::Paths const &paths) {
    int const count = passedCount();
    ::unsetenv("LISTEN_PID");
    ::unsetenv("LISTEN_FDS");
    ::unsetenv("LISTEN_FDNAMES");
    if (count < 0 || count > passedMax) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument, fmt::format("{} passed sockets are not two", count));
    }
    PassedSockets passed;
    for (int descriptor = firstPassed; descriptor < firstPassed + count; ++descriptor) {
        Wire::UniqueFd socket(descriptor);
        ::fcntl(descriptor, F_SETFD, FD_CLOEXEC);
        // By name, not by whole path: the service manager may have spelled the root in another way.
        std::string const path = boundPath(descriptor);
        std::string_view const name = lastPart(path);
        if (!name.empty() && name == lastPart(paths.orderedSocket())) {
            passed.ordered = std::move(socket);
        } else if (!name.empty() && name == lastPart(paths.prioritySocket())) {
            passed.priority = std::move(socket);
        } else {
            throw Wire::Failure(Wire::ErrorCode::InvalidArgument,
                                fmt::format("the passed descriptor {} is no listening socket of this daemon ({})",
                                            descriptor, path.empty() ? "no path" : path));
        }
    }
    for (Wire::UniqueFd const *socket : {&passed.ordered, &passed.priority}) {
        if (*socket) {
            ::fcntl(socket->get(), F_SETFL, ::fcntl(socket->get(), F_GETFL) | O_NONBLOCK);
        }
    }
    return passed;
}

void notifyServiceManager(std::string const &state) {
    char const *const path = std::getenv("NOTIFY_SOCKET");
    sockaddr_un address{};
    std::size_t const length = path == nullptr ? 0 : std::strlen(path);
    if (length < 2 || length >= sizeof address.sun_path) {
        return;
    }
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, path, length);
    if (path[0] == '@') {
        address.sun_path[0] = '\0'; // a name of the abstract kind
    }
    Wire::UniqueFd const socket(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
    if (socket) {
        auto const size = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + length);
        ::sendto(socket.get(), state.data(), state.size(), MSG_NOSIGNAL, reinterpret_cast<sockaddr const *>(&address),
                 size);
    }
}

} // namespace Lumod
