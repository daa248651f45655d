// SPDX-License-Identifier: Apache-2.0
#include <cerrno>
#include <fstream>
#include <istream>
#include <system_error>

#include "Commands.h"
#include "Words.h"
#include "orka/Topology.h"
#include "wire/Failure.h"

namespace Orkasim {

namespace {

/// Ten times what a hundred thousand containers take; a device without an end is refused here.
constexpr std::size_t mostBytes = std::size_t{256} << 20;

std::string readAll(std::istream &stream, std::string const &name) {
    constexpr std::size_t blockBytes = std::size_t{1} << 20;
    std::string text;
    std::string block(blockBytes, '\0');
    while (stream.read(block.data(), blockBytes) || stream.gcount() > 0) {
        text.append(block, 0, static_cast<std::size_t>(stream.gcount()));
        if (text.size() > mostBytes) {
            throw Wire::Failure(Wire::ErrorCode::TooLarge,
                                "the topology '" + name + "' is larger than the 256 MiB that one may be");
        }
    }
    if (stream.bad()) {
        throw Wire::Failure(Wire::ErrorCode::IoError, "the topology '" + name + "' cannot be read");
    }
    return text;
}

std::string readTopology(std::string const &path, Console const &console) {
    if (path == "-") {
        return readAll(console.in, "standard input");
    }
    errno = 0;
    std::ifstream file(path, std::ios::binary);
    // A directory opens, but gives nothing.
    if (!file || file.peek() == std::ifstream::traits_type::eof()) {
        int const reason = errno;
        if (reason != 0) {
            throw Wire::Failure(Wire::ErrorCode::IoError, "the topology '" + path + "' cannot be read: " +
                                                              std::generic_category().message(reason));
        }
    }
    return readAll(file, path);
}

} // namespace

void make(Words const &words, Console const &console) {
    SortedWords const sorted(words, {"--force"});
    auto const &named = sorted.named({"TOPOLOGY", "ARRAYFILE"});
    auto const &source = named[0];
    auto const topology = Orka::parseTopology(readTopology(source, console), source == "-" ? "standard input" : source);
    Orka::makeArrayFile(topology, named[1], sorted.has("--force") ? Orka::Replace::ArrayFile : Orka::Replace::Never);
}

} // namespace Orkasim
