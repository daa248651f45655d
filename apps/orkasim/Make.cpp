// SPDX-License-Identifier: Apache-2.0
#include <cerrno>
#include <fstream>
#include <istream>
#include <iterator>
#include <system_error>

#include "Commands.h"
#include "Words.h"
#include "orka/Topology.h"
#include "wire/Failure.h"

namespace Orkasim {

namespace {

std::string readAll(std::istream &stream, std::string const &name) {
    std::string text{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
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
