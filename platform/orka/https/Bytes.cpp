// SPDX-License-Identifier: Apache-2.0
#include "https/Bytes.h"

#include <utility>

#include <kj/array.h>

namespace Orka::Https {

namespace {

constexpr std::size_t blockBytes = std::size_t{64} << 10;

struct Reading {
    kj::AsyncInputStream &stream;
    std::size_t most;
    kj::Array<char> block = kj::heapArray<char>(blockBytes);
    std::string text{};

    kj::Promise<std::optional<std::string>> go() {
        return stream.tryRead(block.begin(), 1, block.size())
            .then([this](std::size_t count) -> kj::Promise<std::optional<std::string>> {
                if (count == 0) {
                    return std::optional(std::move(text));
                }
                if (text.size() + count > most) {
                    return std::optional<std::string>();
                }
                text.append(block.begin(), count);
                return go();
            });
    }
};

} // namespace

kj::Promise<std::optional<std::string>> readUpTo(kj::AsyncInputStream &stream, std::size_t most) {
    auto const announced = stream.tryGetLength();
    KJ_IF_MAYBE (length, announced) {
        if (*length > most) {
            return std::optional<std::string>();
        }
    }
    auto reading = kj::heap<Reading>(Reading{stream, most});
    auto promise = reading->go();
    return promise.attach(kj::mv(reading));
}

} // namespace Orka::Https
