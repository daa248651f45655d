// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

#include "https/Base64.h"
#include "https/Messages.h"
#include "wire/Failure.h"

namespace Orka::Https {

/// Writes values as JSON by their fields(). What an optional member does not hold is left out.
class BodyWriter {
public:
    template <typename... Objects>
    void object(Objects const &...objects) {
        writer_.StartObject();
        (fields(*this, objects), ...);
        writer_.EndObject();
    }
    /// The document. @throws Wire::Failure InvalidArgument when a text in it is not UTF-8
    std::string take() {
        if (!valid_) {
            throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "a text that is not UTF-8 cannot be sent as JSON");
        }
        return {buffer_.GetString(), buffer_.GetSize()};
    }
    std::size_t size() const {
        return buffer_.GetSize();
    }

    void text(char const *member, std::string const &value) {
        writer_.Key(member);
        put(value);
    }
    void text(char const *member, std::optional<std::string> const &value) {
        if (value) {
            text(member, *value);
        }
    }
    void name(char const *member, std::string const &value) {
        text(member, value);
    }
    void uuid(char const *member, std::string const &value) {
        text(member, value);
    }
    void number(char const *member, int64_t value) {
        writer_.Key(member);
        writer_.Int64(value);
    }
    void amount(char const *member, int64_t value) {
        number(member, value);
    }
    void amount(char const *member, std::optional<int64_t> const &value) {
        if (value) {
            number(member, *value);
        }
    }
    void flag(char const *member, bool value) {
        writer_.Key(member);
        writer_.Bool(value);
    }
    void kind(char const *member, VolumeKind value) {
        // One that there is not is for the provider to refuse, not to be taken for another here.
        text(member, value == VolumeKind::Config ? "config"
                     : value == VolumeKind::Data ? "data"
                                                 : "kind " + std::to_string(static_cast<int32_t>(value)));
    }
    void bytes(char const *member, std::vector<uint8_t> const &value) {
        text(member, base64Of(value));
    }
    void texts(char const *member, std::vector<std::string> const &values) {
        writer_.Key(member);
        writer_.StartArray();
        for (auto const &value : values) {
            put(value);
        }
        writer_.EndArray();
    }
    template <typename T>
    void list(char const *member, std::vector<T> const &values) {
        writer_.Key(member);
        writer_.StartArray();
        for (auto const &value : values) {
            object(value);
        }
        writer_.EndArray();
    }
    /// The elements from `offset` on, at most so many, and about so many bytes of the document at most, but one at
    /// least.
    /// @return how many
    template <typename T>
    std::size_t slice(char const *member, std::vector<T> const &values, std::size_t offset, std::size_t most,
                      std::size_t bytesMost) {
        writer_.Key(member);
        writer_.StartArray();
        std::size_t count = 0;
        while (offset + count < values.size() && count < most && (count == 0 || size() < bytesMost)) {
            object(values[offset + count++]);
        }
        writer_.EndArray();
        return count;
    }
    void begin() {
        writer_.StartObject();
    }
    void end() {
        writer_.EndObject();
    }
    template <typename T>
    void structure(char const *member, T const &value) {
        writer_.Key(member);
        object(value);
    }
    template <typename T>
    void structure(char const *member, std::optional<T> const &value) {
        if (value) {
            structure(member, *value);
        }
    }

private:
    void put(std::string const &value) {
        valid_ = writer_.String(value.data(), static_cast<rapidjson::SizeType>(value.size())) && valid_;
    }

    rapidjson::StringBuffer buffer_;
    rapidjson::Writer<rapidjson::StringBuffer, rapidjson::UTF8<>, rapidjson::UTF8<>, rapidjson::CrtAllocator,
                      rapidjson::kWriteValidateEncodingFlag>
        writer_{buffer_};
    bool valid_ = true;
};

/// One document that holds the members of every value given.
template <typename... Objects>
std::string bodyOf(Objects const &...objects) {
    BodyWriter writer;
    writer.object(objects...);
    return writer.take();
}

} // namespace Orka::Https
