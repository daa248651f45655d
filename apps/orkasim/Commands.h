// SPDX-License-Identifier: Apache-2.0
//
// One function a command. A command gets the words that follow its name, throws UsageError for words that make no sense
// and Wire::Failure for what went wrong, and returns when it is done.
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

#include "Console.h"

namespace Orkasim {

using Words = std::vector<std::string>;

/// What is wrong with the words on the command line.
class UsageError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// make [--force] TOPOLOGY ARRAYFILE
void make(Words const &words, Console const &console);

/// show ARRAYFILE
void show(Words const &words, Console const &console);

/// serve [options] ARRAYFILE, until a signal ends it
void serve(Words const &words, Console const &console);

} // namespace Orkasim
