// SPDX-License-Identifier: Apache-2.0
//
// Inputs of the targets that open database files. One that begins as such a file does is the file. Any other is SQL,
// and the file is a sound one after it ran: what takes a search ages to find in bytes, a changed layout or a row that
// breaks the layout's rules, is a few words then.
#pragma once

#include <string>
#include <string_view>

namespace Fuzz {

/// Puts the file that an input stands for at a path; a journal that lay there goes.
/// @param sound the file that statements are run on
void putDatabase(std::string const &path, std::string_view sound, std::string_view input);

/// The same database in as few bytes as it takes.
std::string smallest(std::string const &path);

} // namespace Fuzz
