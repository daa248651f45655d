// SPDX-License-Identifier: Apache-2.0
//
// Code that is written once and compiled twice: against the accessors of the Cap'n Proto library and against the
// compact ones. That it compiles holds their names together; what it fills and prints holds their meaning together.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <capnp/message.h>

#include "wire/compact/MessageReader.h"
#include "wire/lumod.capnp.h"
#include "wire/lumod.compact.h"

namespace BothApis {

/// The union members of requests and replies; one more stands for a member that does not exist.
inline constexpr unsigned requestKinds = 23;
inline constexpr unsigned replyKinds = 14;

/// A text for either side's setters.
struct TextArgument {
    std::string const &text;
    operator capnp::Text::Reader() const { // NOLINT(google-explicit-constructor)
        return {text.c_str(), text.size()};
    }
    operator std::string_view() const { // NOLINT(google-explicit-constructor)
        return text;
    }
};

struct DataArgument {
    std::vector<std::uint8_t> const &data;
    operator capnp::Data::Reader() const { // NOLINT(google-explicit-constructor)
        return {data.data(), data.size()};
    }
    operator std::span<std::uint8_t const>() const { // NOLINT(google-explicit-constructor)
        return data;
    }
};

/// Turns bytes into the values of a message; zero and empty when they have run out.
class Choices {
public:
    explicit Choices(std::vector<std::uint8_t> bytes)
        : bytes_(std::move(bytes)) {}
    std::uint64_t number();
    bool flag() {
        return byte() % 2 != 0;
    }
    unsigned length() {
        return byte() % 5;
    }
    TextArgument text();
    DataArgument data();

private:
    std::uint8_t byte() {
        return next_ < bytes_.size() ? bytes_[next_++] : std::uint8_t{0};
    }

    std::vector<std::uint8_t> bytes_;
    std::size_t next_ = 0;
    std::string text_;
    std::vector<std::uint8_t> data_;
};

void fill(Wire::Request::Builder request, unsigned kind, Choices choices);
void fill(Wire::Compact::Request::Builder request, unsigned kind, Choices choices);
void fill(Wire::Reply::Builder reply, unsigned kind, Choices choices);
void fill(Wire::Compact::Reply::Builder reply, unsigned kind, Choices choices);

/// Everything that is in a message, and which pointers are null.
std::string printed(Wire::Request::Reader request);
std::string printed(Wire::Compact::Request::Reader request);
std::string printed(Wire::Reply::Reader reply);
std::string printed(Wire::Compact::Reply::Reader reply);

} // namespace BothApis
