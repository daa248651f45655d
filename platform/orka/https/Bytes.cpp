// SPDX-License-Identifier: Apache-2.0
#include "https/Bytes.h"

#include <string_view>
#include <utility>

#include <strings.h>

#include <kj/array.h>

#include "https/Protocol.h"

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

bool isJson(kj::HttpHeaders const &headers) {
    KJ_IF_MAYBE (value, headers.get(kj::HttpHeaderId::CONTENT_TYPE)) {
        std::string_view type(value->cStr());
        type = type.substr(0, type.find_first_of("; \t"));
        std::string_view const json(jsonType);
        return type.size() == json.size() && ::strncasecmp(type.data(), json.data(), json.size()) == 0;
    }
    return false;
}

} // namespace Orka::Https
