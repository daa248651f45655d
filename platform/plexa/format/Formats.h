// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "plexa/Formatter.h"

namespace Plexa {

/// `Label: value` lines; structures under their headings, lists under their labels.
void writeSimple(Result const &result, FormatSettings const &settings, Sink &sink);

/// Rows and columns; a list of structures inside a row becomes an indented table under it.
void writeTable(Result const &result, FormatSettings const &settings, Sink &sink);

/// Nodes joined by lines.
void writeTree(Result const &result, FormatSettings const &settings, Sink &sink);

/// One JSON document: every declared field in declared order, null where a value is not set.
void writeJson(Result const &result, FormatSettings const &settings, Sink &sink);

/// One YAML document that means the same as the JSON one.
void writeYaml(Result const &result, FormatSettings const &settings, Sink &sink);

/// One XML document: an element for each value, named after its type.
void writeXml(Result const &result, FormatSettings const &settings, Sink &sink);

/// A header line and a line for each structure.
void writeCsv(Result const &result, FormatSettings const &settings, Sink &sink);

/// A line for each value: its path, an equals sign, and the value as JSON has it.
void writeKeyValue(Result const &result, FormatSettings const &settings, Sink &sink);

} // namespace Plexa
