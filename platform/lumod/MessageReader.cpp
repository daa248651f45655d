// SPDX-License-Identifier: Apache-2.0
#include "MessageReader.h"

#include "wire/Limits.h"

namespace Lumod {

using Wire::ErrorCode;
using Wire::Failure;
using Wire::SegmentTable;

Answer<bool> MessageReader::next() {
    return stream_.tryRead(table_.data(), 1, SegmentTable::prefixBytes).then([this](std::size_t have) -> Answer<bool> {
        if (have == 0) {
            return Outcome<bool>(false);
        }
        // One deadline for the whole message: a byte now and then does not move it.
        auto tooSlow = timer_.afterDelay(patience).then([]() -> Outcome<bool> {
            return Failure(ErrorCode::DeadlineExceeded, "a request was begun and not finished in time");
        });
        return readMessage(have).exclusiveJoin(kj::mv(tooSlow));
    });
}

Answer<bool> MessageReader::readMessage(std::size_t have) {
    auto prefix = readExactly(table_.data() + have, SegmentTable::prefixBytes - have);
    auto table = andThen(kj::mv(prefix), [this](Done) {
        std::size_t const bytes = SegmentTable::bytesOf(table_.data());
        return readExactly(table_.data() + SegmentTable::prefixBytes, bytes - SegmentTable::prefixBytes);
    });
    auto body = andThen(kj::mv(table), [this](Done) {
        kj::ArrayPtr<kj::byte> place = buffer_.prepare(SegmentTable(table_.data(), Wire::requestBytesMax));
        return readExactly(place.begin(), place.size());
    });
    return andThen(kj::mv(body), [](Done) { return true; });
}

Answer<Done> MessageReader::readExactly(std::uint8_t *place, std::size_t bytes) {
    if (bytes == 0) {
        return Outcome<Done>(Done{});
    }
    return stream_.tryRead(place, bytes, bytes).then([bytes](std::size_t got) -> Outcome<Done> {
        if (got < bytes) {
            return Failure(ErrorCode::ConnectionLost, "the peer closed the connection in the middle of a request");
        }
        return Done{};
    });
}

} // namespace Lumod
