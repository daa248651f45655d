// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>

#include "wire/compact/MessageReader.h"

namespace Wire::Compact {

/// Room for the body of one received message, used again for the next one, and its reader.
class ReceivedMessage {
public:
    /// Makes room for the body that a checked table announces; what was held before is gone.
    /// @return where the body's bytes belong
    std::span<std::uint8_t> prepare(SegmentTable const &table);

    /// Call it once the bytes are there. What it returns lives until the next prepare or release.
    /// @throw Malformed
    template <typename Struct>
    typename Struct::Reader getRoot() {
        return reader_->getRoot<Struct>();
    }

    std::size_t bodyBytes() const {
        return bodyBytes_;
    }
    std::size_t capacityBytes() const {
        return capacityWords_ * bytesPerWord;
    }
    /// Gives the memory back.
    void release();

private:
    std::unique_ptr<Word[]> words_;
    std::size_t capacityWords_ = 0;
    std::size_t bodyBytes_ = 0;
    std::optional<MessageReader> reader_;
};

} // namespace Wire::Compact
