// SPDX-License-Identifier: Apache-2.0
#include "Property.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include "plexa/Text.h"

namespace Fuzz {

void broken(std::string_view property, std::string_view detail) {
    std::fprintf(stderr, "property broken: %.*s\n%.*s\n", static_cast<int>(property.size()), property.data(),
                 static_cast<int>(detail.size()), detail.data());
    std::abort();
}

void requireSentence(std::string_view sentence) {
    require(!sentence.empty(), "a failure says something");
    require(Plexa::isValidUtf8(sentence), "a sentence is UTF-8", sentence);
    require(std::none_of(sentence.begin(), sentence.end(),
                         [](char c) { return static_cast<unsigned char>(c) < ' ' || c == '\x7F'; }),
            "a sentence is one line without control characters", sentence);
}

void requireFailure(Wire::Failure const &failure) {
    require(failure.code() != Wire::ErrorCode::Success, "a failure is none", failure.sentence());
    require(Wire::textOf(static_cast<std::int32_t>(failure.code())) != nullptr, "a failure's code is in the table",
            failure.sentence());
    require(!failure.sentence().empty(), "a failure says something");
}

} // namespace Fuzz
