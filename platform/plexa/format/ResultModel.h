// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/FormatSettings.h"
#include "plexa/MetaObj.h"

namespace Plexa {

using Object = boost::shared_ptr<MetaObj::MetaObject>;

enum class Kind { Nothing, Scalar, Number, ScalarList, StructList, Struct };

/// What a value is, or, where there is no value, what its schema declares.
Kind kindOf(Object const &value, Object const &schema);

/// False for a value that is absent or a scalar that was never set.
bool isSet(Object const &value);

/// A scalar's text as it came: not escaped, without unit. Empty for a value that is not set or no scalar.
std::string scalarText(Object const &value);

/// The schema of a list's elements: what the list was made with, else what the list's own schema declares.
Object elementSchema(Object const &list, Object const &schema);

/// A field of a structure and what it is declared as; the schema may be empty.
struct FieldPlan {
    std::string name;
    Object schema;
    std::string unit;
};

/// The fields of a structure that are shown, in order: the declared ones in declared order, then what the value holds
/// beyond them, unless a choice says otherwise. Names that are no field's are passed over.
using StructurePlan = std::vector<FieldPlan>;

/// Which fields are chosen of a structure; nothing for all of them.
using Choice = std::function<std::optional<std::vector<std::string>>(std::string const &structure)>;

/// Plans for the structures of a result. A long list has one plan, made at its first element.
class StructurePlans {
public:
    /// @param settings for the units; must outlive this
    StructurePlans(FormatSettings const &settings, Choice choice);

    /// @param schema what the structure is declared as; may be empty
    std::shared_ptr<StructurePlan const> planOf(MetaObj::MetaStruct const &structure, Object const &schema);

private:
    struct Known {
        std::vector<std::string> names; ///< of the value that the plan was made for
        std::shared_ptr<StructurePlan const> plan;
    };

    FormatSettings const &settings_;
    Choice choice_;
    std::map<MetaObj::MetaObject const *, Known> known_; // by schema
};

} // namespace Plexa
