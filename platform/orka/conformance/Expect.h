// SPDX-License-Identifier: Apache-2.0
//
// How a case says what it demands. What is not met ends the case.
#pragma once

#include <initializer_list>
#include <string>

#include "conformance/Show.h"

namespace Orka::Conformance {

/// Ends a case that failed. Both texts are printable.
struct Unmet {
    std::string expected;
    std::string came;
};

/// Ends a case that cannot be tried on this array.
struct Inapplicable {
    std::string why;
};

/// Ends every case: the run is to end.
struct Interrupted {};

template <typename T>
void expectEqual(std::string const &what, T const &expected, T const &came) {
    if (!(expected == came)) {
        throw Unmet{what + ": " + show(expected), show(came)};
    }
}

/// @param expected what should be, in words
inline void expectTrue(std::string const &expected, bool isSo, std::string const &came) {
    if (!isSo) {
        throw Unmet{expected, came};
    }
}

template <typename T>
T expectSuccess(std::string const &what, Outcome<T> outcome) {
    if (!outcome.ok()) {
        throw Unmet{what, show(outcome.failure())};
    }
    return std::move(outcome).value();
}

/// A failure of one of these codes, with a sentence.
template <typename T>
void expectFailure(std::string const &what, std::initializer_list<Wire::ErrorCode> codes, Outcome<T> const &outcome) {
    bool known = false;
    std::string expected = what;
    for (auto const code : codes) {
        known = known || (!outcome.ok() && outcome.failure().code() == code);
        expected += (code == *codes.begin() ? ": " : ", or ") + show(code);
    }
    expectTrue(expected, known, show(outcome));
    expectTrue(what + ": a sentence that tells why", !outcome.failure().sentence().empty(), "an empty sentence");
}

template <typename T>
void expectFailure(std::string const &what, Wire::ErrorCode code, Outcome<T> const &outcome) {
    expectFailure(what, {code}, outcome);
}

} // namespace Orka::Conformance
