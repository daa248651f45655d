// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "plexa/Formatter.h"

namespace Plexa {

/// `Label: value` lines; structures under their headings, lists under their labels.
void writeSimple(Result const &result, FormatSettings const &settings, Sink &sink);

/// Rows and columns; a list of structures inside a row becomes an indented table under it.
void writeTable(Result const &result, FormatSettings const &settings, Sink &sink);

/// One JSON document: every declared field in declared order, null where a value is not set.
void writeJson(Result const &result, FormatSettings const &settings, Sink &sink);

} // namespace Plexa
