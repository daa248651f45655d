// SPDX-License-Identifier: Apache-2.0
//
// Values as a failed case tells them. The texts are whatever a provider sent, so everything that a terminal would obey
// or a document could not hold is written as \x1b and the like, and what is long is cut.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "orka/Model.h"
#include "orka/Outcome.h"
#include "orka/conformance/Printable.h"

namespace Orka::Conformance {

std::string show(std::string_view text);
std::string show(std::string const &text);
std::string show(bool value);
std::string show(int64_t value);
std::string show(uint64_t value);
std::string show(VolumeKind kind);
std::string show(Endpoint const &endpoint);
std::string show(StorageArray const &array);
std::string show(StorageContainer const &container);
std::string show(VirtualVolume const &volume);
std::string show(MetadataPair const &pair);
std::string show(ConfigVolume const &volume);
std::string show(VolumePresence const &presence);
std::string show(SpaceStats const &stats);
std::string show(UnsharedChunks const &chunks);
std::string show(Done const &);
std::string show(Wire::ErrorCode code);
std::string show(Wire::Failure const &failure);

template <typename T>
std::string show(std::optional<T> const &value) {
    return value ? show(*value) : std::string("nothing");
}

template <typename T>
std::string show(std::vector<T> const &values) {
    constexpr size_t most = 12;
    std::string text = "[";
    for (size_t index = 0; index < values.size() && index < most; ++index) {
        text += (index == 0 ? "" : ", ") + show(values[index]);
    }
    return text + (values.size() > most ? ", ... " + std::to_string(values.size()) + " in all]" : "]");
}

template <typename T>
std::string show(Outcome<T> const &outcome) {
    return outcome.ok() ? show(outcome.value()) : show(outcome.failure());
}

} // namespace Orka::Conformance
