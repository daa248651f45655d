// SPDX-License-Identifier: Apache-2.0
#include "DescriptorSink.h"

#include <cerrno>
#include <cstring>
#include <poll.h>
#include <unistd.h>

namespace Tovicli {

DescriptorSink::DescriptorSink(int descriptor)
    : descriptor_(descriptor) {}

void DescriptorSink::write(std::string_view text) {
    while (!text.empty() && error_ == 0) {
        ssize_t const written = ::write(descriptor_, text.data(), text.size());
        if (written >= 0) {
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
    return error_ == 0 ? std::string() : std::string(std::strerror(error_));
}

} // namespace Tovicli
