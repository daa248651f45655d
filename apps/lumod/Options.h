// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include <sys/types.h>

#include "lumod/Log.h"

/// What the command line asks for.
struct Options {
    std::string root;
    Lumod::LogLevel logLevel = Lumod::LogLevel::Info;
    int64_t unbindPeriodUs = 300'000'000;
    std::optional<gid_t> group;
    bool help = false;
    bool version = false;
};

/// @param root     what holds without --root
/// @param logLevel what holds without --log-level: a level's name, or empty
/// @throws Wire::Failure InvalidArgument, with a sentence for the user
Options parseOptions(int count, char **arguments, std::string root, std::string const &logLevel);

std::string helpText();
