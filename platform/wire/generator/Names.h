// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace CompactGenerator {

/// "storageArrays" becomes "StorageArrays".
std::string capitalized(std::string name);
/// "storageArrays" becomes "STORAGE_ARRAYS".
std::string enumerator(std::string const &name);
/// "lumod.capnp:Outer.Inner" becomes "Outer::Inner".
std::string scopedName(std::string const &displayName);
/// What stands behind the last "::".
std::string ownName(std::string const &scopedName);

} // namespace CompactGenerator
