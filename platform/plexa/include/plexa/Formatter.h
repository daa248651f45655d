// SPDX-License-Identifier: Apache-2.0
//
// From a result to text. A formatter knows values and schemas, never commands; it writes as it goes, so that a long
// list is on its way before its end is formatted.
//
// A new format is one file in format/ with one function, and one line in the table in Formatters.cpp.
#pragma once

#include <string>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/FormatSettings.h"
#include "plexa/MetaObj.h"
#include "plexa/Sink.h"

namespace Plexa {

/// What a call left, and what its command declared; the schema may be empty.
struct Result {
    boost::shared_ptr<MetaObj::MetaObject> value;
    boost::shared_ptr<MetaObj::MetaObject> schema;
};

struct Format {
    char const *name;
    /// For programs: one whole document, every declared field, no units, errors as documents too.
    bool isMachine;
    void (*write)(Result const &result, FormatSettings const &settings, Sink &sink);
};

/// @return null for a name that is no format's.
Format const *findFormat(std::string const &name);

/// "simple, table, json": what there is.
std::string formatNames();

/// @throws UsageError that says what there is
/// @param origin where the name stood: "--format" or "TOVI_FORMAT"
Format const &requireFormat(std::string const &name, std::string const &origin);

/// The structure that a result, or each element of it, is declared as; empty when it is none.
boost::shared_ptr<MetaObj::MetaStruct> outermostStructure(boost::shared_ptr<MetaObj::MetaObject> const &schema);

} // namespace Plexa
