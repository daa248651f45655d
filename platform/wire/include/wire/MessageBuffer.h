// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <memory>

#include <capnp/message.h>

#include "wire/SegmentTable.h"

namespace Wire {

/// How every message of a peer is read: limited nesting, and no word visited more than visitsOfAWordMax times.
/// Keep what a getter returns; each call of a getter of a list or structure counts as a visit of all of it.
capnp::ReaderOptions readerOptions(std::size_t bodyBytes);

/// Room for the body of one received message, used again for the next one.
class MessageBuffer {
public:
    /// Makes room for the body that a checked table announces; what was held before is gone.
    /// @return where the body's bodyBytes() bytes belong
    kj::ArrayPtr<kj::byte> prepare(SegmentTable const &table);

    /// The segments of the body, for a capnp::SegmentArrayMessageReader. Valid until the next prepare or release.
    kj::ArrayPtr<kj::ArrayPtr<capnp::word const> const> segments() const;
    std::size_t bodyBytes() const {
        return table_.bodyBytes();
    }
    std::size_t capacityBytes() const {
        return capacityWords_ * sizeof(capnp::word);
    }
    /// Gives the memory back.
    void release();

private:
    SegmentTable table_;
    std::unique_ptr<capnp::word[]> words_;
    std::size_t capacityWords_ = 0;
    std::array<kj::ArrayPtr<capnp::word const>, segmentCountMax> segments_;
};

} // namespace Wire
