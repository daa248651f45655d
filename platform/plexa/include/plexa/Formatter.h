// SPDX-License-Identifier: Apache-2.0
//
// From a result to text. A formatter knows values and schemas, never commands. It writes as it walks: beside the result
// itself it holds one buffer of bounded size and one row, however long the list is.
//
// A new format is one file in format/ with one function, and one line in the table in Formatters.cpp.
#pragma once

#include <string>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/FormatSettings.h"
#include "plexa/MetaObj.h"
#include "plexa/SentenceError.h"
#include "plexa/Sink.h"

namespace Plexa {

/// What a call left, and what its command declared; the schema may be empty.
struct Result {
    boost::shared_ptr<MetaObj::MetaObject> value;
    boost::shared_ptr<MetaObj::MetaObject> schema;
};

/// A result that a format cannot hold. The sentence names the format and the field, ready to be shown.
class FormatError : public SentenceError {
public:
    using SentenceError::SentenceError;
};

struct Format {
    char const *name;
    /// For programs: one whole document, every declared field, no units, errors as documents too.
    bool isMachine;
    /// Writes one whole document. Whether it arrived is told by the sink.
    /// @throws FormatError before anything of the value, or of the list's element, in question is written
    void (*write)(Result const &result, FormatSettings const &settings, Sink &sink);
};

/// @return null for a name that is no format's.
Format const *findFormat(std::string const &name);

/// "simple, table, ...": what there is.
std::string formatNames();

/// @throws UsageError that says what there is
/// @param origin where the name stood: "--format" or "TOVI_FORMAT"
Format const &requireFormat(std::string const &name, std::string const &origin);

/// The structure that a result, or each element of it, is declared as; empty when it is none.
boost::shared_ptr<MetaObj::MetaStruct> outermostStructure(boost::shared_ptr<MetaObj::MetaObject> const &schema);

} // namespace Plexa
