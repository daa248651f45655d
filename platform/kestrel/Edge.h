// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <exception>
#include <new>
#include <string>
#include <utility>

#include "gantry/Lib.h"
#include "lumolib/LastFailure.h"
#include "wire/Failure.h"

namespace Kestrel {

/// A sentence quotes names that users and arrays chose. The tool makes them harmless for a terminal, but it lets a
/// message have several lines, so that a name with a line break in it could pass for a message of its own.
inline std::string onOneLine(std::string sentence) {
    for (auto const &[broken, shown] : {std::pair{'\n', "\\n"}, std::pair{'\t', "\\t"}}) {
        for (auto at = sentence.find(broken); at != std::string::npos; at = sentence.find(broken, at)) {
            sentence.replace(at, 1, shown);
        }
    }
    return sentence;
}

/// Notes a failure for the tool and throws it as the interface promises.
[[noreturn]] inline void failAtEdge(Wire::ErrorCode code, std::string const &sentence) {
    std::string const line = onOneLine(sentence);
    LumoPlatform_NoteFailure(static_cast<int32_t>(code), line.c_str());
    throw Gantry::Lib::GantryException(line, Gantry::Lib::QuibMessage());
}

/// The one place where failures of the store, the client and the file system become GantryExceptions: every operation
/// of the interface runs in it.
template <typename Operation>
auto atEdge(Operation const &operation) {
    try {
        return operation();
    } catch (Wire::Failure const &failure) {
        failAtEdge(failure.code(), failure.sentence());
    } catch (std::bad_alloc const &) {
        failAtEdge(Wire::ErrorCode::OutOfMemory, "the host's storage configuration ran out of memory");
    } catch (std::exception const &cause) {
        failAtEdge(Wire::ErrorCode::InternalError,
                   std::string("the host's storage configuration failed unexpectedly: ") + cause.what());
    }
}

} // namespace Kestrel
