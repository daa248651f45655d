// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace Store {

/// Makes a directory and what is missing above it, each with its entry synced. One that is there already is success.
/// Throws Wire::Failure.
void makeDirectoryDurably(std::string const &path);

} // namespace Store
