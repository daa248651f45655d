// SPDX-License-Identifier: Apache-2.0
#include "DescriptorSink.h"

#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

namespace Tovicli {

DescriptorSink::DescriptorSink(int descriptor)
    : descriptor_(descriptor) {}

void DescriptorSink::write(std::string_view text) {
    while (!text.empty() && error_ == 0) {
        ssize_t const written = ::write(descriptor_, text.data(), text.size());
        if (written >= 0) {
            hasWritten_ = true;
            text.remove_prefix(static_cast<std::size_t>(written));
        } else if (errno == EAGAIN) {
            // Somebody else made the terminal or pipe non-blocking: wait until it takes more.
            pollfd waiting{descriptor_, POLLOUT, 0};
            poll(&waiting, 1, -1);
        } else if (errno != EINTR) {
            error_ = errno;
        }
    }
}

std::string DescriptorSink::problem() const {
    int error = error_;
    if (error == 0 && hasWritten_) {
        // A file system that writes later tells what came of it when a descriptor is closed; any will do.
        int const duplicate = fcntl(descriptor_, F_DUPFD_CLOEXEC, 0);
        if (duplicate >= 0 && close(duplicate) != 0) {
            error = errno;
        }
    }
    return error == 0 || error == EINTR ? std::string() : std::string(std::strerror(error));
}

} // namespace Tovicli
