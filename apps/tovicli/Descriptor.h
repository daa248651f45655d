// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <unistd.h>
#include <utility>

namespace Tovicli {

/// An open file descriptor; closed at the end. Negative when there is none.
class Descriptor {
public:
    explicit Descriptor(int number = -1)
        : number_(number) {}
    ~Descriptor() {
        if (number_ >= 0) {
            close(number_);
        }
    }
    Descriptor(Descriptor &&other) noexcept
        : number_(std::exchange(other.number_, -1)) {}
    Descriptor &operator=(Descriptor &&other) noexcept {
        std::swap(number_, other.number_);
        return *this;
    }

    int number() const {
        return number_;
    }
    bool isOpen() const {
        return number_ >= 0;
    }
    /// Leaves the descriptor open for the rest of the process.
    void keepForever() {
        number_ = -1;
    }

private:
    int number_;
};

} // namespace Tovicli
