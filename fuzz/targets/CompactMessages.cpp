// SPDX-License-Identifier: Apache-2.0
//
// Messages as they stand on the socket, read by the client's own accessors and by the daemon's library: both refuse the
// same ones and find the same in the others.
#include <algorithm>
#include <array>
#include <cstring>
#include <optional>
#include <string>
#include <vector>

#include "BothApis.h"
#include "Property.h"
#include "wire/Limits.h"
#include "wire/MessageBuffer.h"
#include "wire/SegmentTable.h"
#include "wire/compact/Malformed.h"
#include "wire/compact/ReceivedMessage.h"

namespace {

using Fuzz::require;

constexpr char const *malformed = "malformed";

/// A message's table and the bytes behind it, as both ends read them; nothing for a table that does not pass, and for a
/// body that is cut off.
struct Framed {
    Wire::SegmentTable table;
    std::uint8_t const *body;
};

std::optional<Framed> framed(std::uint8_t const *data, std::size_t size) {
    if (size < Wire::SegmentTable::prefixBytes) {
        return std::nullopt;
    }
    try {
        std::size_t const tableBytes = Wire::SegmentTable::bytesOf(data);
        require(tableBytes <= Wire::SegmentTable::bytesMax && tableBytes % 8 == 0, "a table has whole words");
        if (size < tableBytes) {
            return std::nullopt;
        }
        Wire::SegmentTable const table(data, Wire::replyBytesMax);
        require(table.bodyBytes() > 0 && table.bodyBytes() <= Wire::replyBytesMax, "a body is within the limit");
        if (table.bodyBytes() > size - tableBytes) {
            return std::nullopt;
        }
        return Framed{table, data + tableBytes};
    } catch (Wire::Failure const &failure) {
        Fuzz::requireFailure(failure);
        return std::nullopt;
    }
}

template <typename Struct>
std::string compactPrint(Framed const &message) {
    Wire::Compact::ReceivedMessage received;
    auto place = received.prepare(message.table);
    std::copy_n(message.body, place.size(), place.begin());
    try {
        return BothApis::printed(received.getRoot<Struct>());
    } catch (Wire::Compact::Malformed const &) {
        return malformed;
    }
}

template <typename Struct>
std::string libraryPrint(Framed const &message) {
    Wire::MessageBuffer buffer;
    auto place = buffer.prepare(message.table);
    std::copy_n(message.body, place.size(), place.begin());
    try {
        capnp::SegmentArrayMessageReader reader(buffer.segments(), Wire::readerOptions(buffer.bodyBytes()));
        return BothApis::printed(reader.getRoot<Struct>());
    } catch (kj::Exception const &) {
        return malformed;
    }
}

template <typename Compact, typename Library>
void compare(Framed const &message, char const *what) {
    std::string const ours = compactPrint<Compact>(message);
    std::string const theirs = libraryPrint<Library>(message);
    require(ours == theirs, what, ours + "\n" + theirs);
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    if (std::optional<Framed> const message = framed(data, size)) {
        compare<Wire::Compact::Reply, Wire::Reply>(*message, "both find the same in a reply");
        compare<Wire::Compact::Request, Wire::Request>(*message, "both find the same in a request");
    }
    return 0;
}
