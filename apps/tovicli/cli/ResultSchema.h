// SPDX-License-Identifier: Apache-2.0
//
// What a command's result looks like in JSON, as a JSON Schema (2020-12).
//
// It describes what `--format json` prints when the user chooses no fields: every declared field is there, null where
// it was not set, nothing beside them; whole numbers are 64 bits wide. `cli describe` shows it, and tests hold results
// against it.
#pragma once

#include <rapidjson/prettywriter.h>
#include <rapidjson/stringbuffer.h>

#include "Frame.h"

namespace Tovicli::Cli {

using JsonWriter = rapidjson::PrettyWriter<rapidjson::StringBuffer>;

void writeText(JsonWriter &writer, std::string const &text);

/// @param result what the command declares; empty when it declares nothing, which any result fits
void writeResultSchema(JsonWriter &writer, ObjectPtr const &result);

} // namespace Tovicli::Cli
