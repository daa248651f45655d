// SPDX-License-Identifier: Apache-2.0
//
// Reading the messages of lumod.capnp without the Cap'n Proto library, for programs whose whole life is one request:
// the library's two shared objects have more names to look up when they are loaded than such a program does work.
//
// The encoding is the library's, and so is what is accepted: lists that grew into lists of structures, structures that
// are shorter or longer than this side knows them, near, far and double-far pointers. The accessors are generated
// from the schema (wire/lumod.compact.h) under the names that the library's own generator gives them.
//
// Nothing outside of the segments is ever read. Nesting is limited, and each word may be visited visitsOfAWordMax
// times: keep what a getter of a list or structure returned, since calling it again counts again.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "wire/Limits.h"
#include "wire/SegmentTable.h"
#include "wire/compact/Malformed.h"
#include "wire/compact/Pointer.h"
#include "wire/compact/StructReader.h"

namespace Wire::Compact {

/// One received body, read in place: the words have to outlive it, and it has to outlive its readers.
class MessageReader {
public:
    /// @param body the words of all segments, one segment after the other
    MessageReader(SegmentTable const &table, Word const *body);
    MessageReader(MessageReader const &) = delete;
    MessageReader &operator=(MessageReader const &) = delete;

    /// @throw Malformed
    template <typename Struct>
    typename Struct::Reader getRoot() {
        return typename Struct::Reader(root());
    }

private:
    StructReader root();

    Visits visits_;
    SegmentList segments_;
};

} // namespace Wire::Compact
