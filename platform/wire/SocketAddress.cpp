// SPDX-License-Identifier: Apache-2.0
#include "wire/SocketAddress.h"

#include <cerrno>
#include <cstddef>
#include <cstring>

#include <fcntl.h>

#include <boost/system/error_code.hpp>

#include "wire/Failure.h"

namespace Wire {

SocketAddress::SocketAddress(std::string const &path) {
    std::string usable = path;
    std::size_t const slash = path.rfind('/');
    if (path.size() >= sizeof address_.sun_path && slash != std::string::npos) {
        std::string const directory = path.substr(0, slash + 1);
        std::string const name = path.substr(slash + 1);
        directory_.reset(open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
        if (!directory_) {
            boost::system::error_code const error(errno, boost::system::system_category());
            ErrorCode const code = error.value() == ENOENT ? ErrorCode::FileMissing : ErrorCode::IoError;
            throw Failure(code, "the directory of the socket " + path + " cannot be opened: " + error.message());
        }
        usable = "/proc/self/fd/" + std::to_string(directory_.get()) + "/" + name;
    }
    if (usable.size() >= sizeof address_.sun_path) {
        throw Failure(ErrorCode::InvalidArgument, "the name of the socket " + path + " is too long");
    }
    address_.sun_family = AF_UNIX;
    std::memcpy(address_.sun_path, usable.c_str(), usable.size() + 1);
}

sockaddr const *SocketAddress::get() const {
    return reinterpret_cast<sockaddr const *>(&address_);
}

socklen_t SocketAddress::size() const {
    return static_cast<socklen_t>(sizeof address_);
}

} // namespace Wire
