// SPDX-License-Identifier: Apache-2.0
#include "MessageReader.h"

#include <algorithm>

#include "wire/Failure.h"
#include "wire/Limits.h"

namespace Lumod {

using Wire::SegmentTable;

namespace {

/// A buffer that grew for a long request is given back after it.
constexpr std::size_t keptBufferBytes = std::size_t{64} << 10;

} // namespace

MessageReader::Progress MessageReader::advance() {
    for (;;) {
        if (!isLong_ && messageBytes_ == 0) {
            look();
        }
        if (isWhole()) {
            return Progress::Whole;
        }
        if (receive() > 0) {
            continue;
        }
        if (!socket_.isOver()) {
            return Progress::Waiting;
        }
        if (hasBegun()) {
            throw Wire::Failure(Wire::ErrorCode::ConnectionLost,
                                "the peer closed the connection in the middle of a request");
        }
        return Progress::Closed;
    }
}

void MessageReader::look() {
    if (have_ < SegmentTable::prefixBytes) {
        return;
    }
    std::size_t const tableBytes = SegmentTable::bytesOf(front_.data());
    if (have_ < tableBytes) {
        return;
    }
    SegmentTable const table(front_.data(), Wire::requestBytesMax);
    std::size_t const bytes = tableBytes + table.bodyBytes();
    if (bytes > front_.size() || table.segmentCount() > 1) {
        moveToBuffer(table, tableBytes);
    } else if (bytes <= have_) {
        messageBytes_ = bytes;
        onlySegment_ =
            kj::arrayPtr(reinterpret_cast<capnp::word const *>(front_.data() + tableBytes), table.segmentWords(0));
    }
}

void MessageReader::moveToBuffer(SegmentTable const &table, std::size_t tableBytes) {
    kj::ArrayPtr<kj::byte> body = buffer_.prepare(table);
    std::size_t const here = std::min(have_ - tableBytes, body.size());
    std::copy_n(front_.data() + tableBytes, here, body.begin());
    removeFront(tableBytes + here);
    missing_ = body.slice(here, body.size());
    isLong_ = true;
}

std::size_t MessageReader::receive() {
    std::size_t got = 0;
    if (isLong_) {
        got = socket_.receive(missing_.begin(), missing_.size());
        missing_ = missing_.slice(got, missing_.size());
    } else {
        got = socket_.receive(front_.data() + have_, front_.size() - have_);
        have_ += got;
    }
    return got;
}

void MessageReader::removeFront(std::size_t bytes) {
    std::copy(front_.data() + bytes, front_.data() + have_, front_.data());
    have_ -= bytes;
}

void MessageReader::drop() {
    if (isLong_) {
        isLong_ = false;
        if (buffer_.capacityBytes() > keptBufferBytes) {
            buffer_.release();
        }
    } else {
        removeFront(messageBytes_);
        messageBytes_ = 0;
    }
}

} // namespace Lumod
