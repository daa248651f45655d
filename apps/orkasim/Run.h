// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Commands.h"

namespace Orkasim {

/// The whole program but for the process: finds the command, runs it, tells of failures.
/// @param words the command line without the program's name
ExitStatus run(Words const &words, Console const &console);

} // namespace Orkasim
