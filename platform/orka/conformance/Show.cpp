// SPDX-License-Identifier: Apache-2.0
#include "conformance/Show.h"

#include <fmt/format.h>

namespace Orka::Conformance {

namespace {

/// Bytes of the valid UTF-8 character that text begins with and that may be seen; 0: there is none.
size_t visibleCharacter(std::string_view text) {
    auto const lead = static_cast<unsigned char>(text.front());
    if (lead < 0x80) {
        return lead >= 0x20 && lead != 0x7f && lead != '\\' ? 1 : 0;
    }
    size_t const bytes = lead >= 0xf0 ? 4 : lead >= 0xe0 ? 3 : 2;
    if (lead < 0xc2 || lead > 0xf4 || text.size() < bytes) {
        return 0;
    }
    uint32_t point = lead & (0xffU >> (bytes + 1));
    for (size_t index = 1; index < bytes; ++index) {
        auto const byte = static_cast<unsigned char>(text[index]);
        if ((byte & 0xc0) != 0x80) {
            return 0;
        }
        point = (point << 6) | (byte & 0x3fU);
    }
    bool const tooLong = point < (bytes == 2 ? 0x80U : bytes == 3 ? 0x800U : 0x10000U);
    bool const surrogate = point >= 0xd800 && point <= 0xdfff;
    // C1 controls, zero-width characters and those that turn the direction of writing, and what is no character.
    bool const unseen = point < 0xa0 || (point >= 0x200b && point <= 0x200f) || (point >= 0x2028 && point <= 0x202e) ||
                        (point >= 0x2066 && point <= 0x2069) || point == 0xfeff || (point & 0xfffe) == 0xfffe ||
                        (point >= 0xfdd0 && point <= 0xfdef);
    return tooLong || surrogate || unseen || point > 0x10ffff ? 0 : bytes;
}

} // namespace

std::string printable(std::string_view text) {
    std::string result;
    while (!text.empty()) {
        auto const bytes = visibleCharacter(text);
        if (bytes > 0) {
            result += text.substr(0, bytes);
        } else {
            result += fmt::format("\\x{:02x}", static_cast<unsigned char>(text.front()));
        }
        text.remove_prefix(bytes > 0 ? bytes : 1);
    }
    return result;
}

std::string show(std::string_view text) {
    constexpr size_t most = 160;
    if (text.size() <= most) {
        return '"' + printable(text) + '"';
    }
    return fmt::format("\"{}...\" of {} bytes", printable(text.substr(0, most)), text.size());
}

std::string show(std::string const &text) {
    return show(std::string_view(text));
}

std::string show(bool value) {
    return value ? "true" : "false";
}

std::string show(int64_t value) {
    return std::to_string(value);
}

std::string show(uint64_t value) {
    return std::to_string(value);
}

std::string show(VolumeKind kind) {
    switch (kind) {
    case VolumeKind::Config:
        return "config";
    case VolumeKind::Data:
        return "data";
    }
    return "kind " + std::to_string(static_cast<int32_t>(kind));
}

std::string show(Endpoint const &endpoint) {
    return fmt::format("endpoint {{uid {}, type {}, texts {} and {}, addresses {}, {}accessible, {}configured}}",
                       show(endpoint.uid), endpoint.type, show(endpoint.text1), show(endpoint.text2),
                       show(endpoint.nfs4xAddresses), endpoint.isAccessible ? "" : "not ",
                       endpoint.isConfigured ? "" : "not ");
}

std::string show(StorageArray const &array) {
    return fmt::format("array {{id {}, name {}, vendor {}, model {}, {}}}", show(array.id), show(array.name),
                       show(array.vendorId), show(array.modelId), show(array.endpoints));
}

std::string show(StorageContainer const &container) {
    return fmt::format("container {{id {}, name {}, maximum {} MB, arrays {}}}", show(container.id),
                       show(container.name), container.maxLumoSizeMb, show(container.arrayIds));
}

std::string show(VirtualVolume const &volume) {
    return fmt::format("{} volume {{uuid {}, container {}, directory {}, {} MB, {} MB committed, {} unshared, profile "
                       "{}, block size {}, machine {}, bound to {}}}",
                       show(volume.kind), show(volume.uuid), show(volume.containerId), show(volume.directoryName),
                       volume.sizeMb, volume.committedMb, show(volume.unsharedMb), show(volume.profile),
                       volume.blockSize, show(volume.vmUuid), show(volume.boundTo));
}

std::string show(MetadataPair const &pair) {
    return show(pair.key) + " = " + show(pair.value);
}

std::string show(ConfigVolume const &volume) {
    return fmt::format("{{{}, directory {}, bound to {}}}", show(volume.uuid), show(volume.directoryName),
                       show(volume.boundTo));
}

std::string show(VolumePresence const &presence) {
    return presence.exists ? "known, bound to " + show(presence.boundTo) : std::string("unknown");
}

std::string show(SpaceStats const &stats) {
    return fmt::format("{} MB, {} MB committed, {} unshared", stats.logicalMb, stats.committedMb,
                       show(stats.unsharedMb));
}

std::string show(UnsharedChunks const &chunks) {
    return fmt::format("chunks of {} bytes in a bitmap of {} bytes", chunks.blockSize, chunks.bitmap.size());
}

std::string show(Done const &) {
    return "success";
}

std::string show(Wire::ErrorCode code) {
    auto const *const text = Wire::textOf(static_cast<int32_t>(code));
    return fmt::format("failure {} ({})", static_cast<int32_t>(code), text == nullptr ? "of no known code" : text);
}

std::string show(Wire::Failure const &failure) {
    return show(failure.code()) + ": " + show(failure.sentence());
}

} // namespace Orka::Conformance
