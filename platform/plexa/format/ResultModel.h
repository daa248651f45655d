// SPDX-License-Identifier: Apache-2.0
//
// What every format reads: values with their types, and the fields of structures in the order in which they are shown.
// All of it is looked at in place; nothing of a result is copied.
#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <typeinfo>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/FormatSettings.h"
#include "plexa/Formatter.h"
#include "plexa/MetaObj.h"

namespace Plexa {

using Object = boost::shared_ptr<MetaObj::MetaObject>;

/// Unset is a value that is absent, or a scalar that was never set.
enum class ValueType { Unset, Boolean, Number, Text, List, Struct, Unknown };

/// Only for a value of that type.
template <typename Value>
Value const &as(MetaObj::MetaObject const *value) {
    return *static_cast<Value const *>(value);
}

/// For classes that derive from MetaObj's: such a one counts as what it derives from.
ValueType typeOfDerived(MetaObj::MetaObject const *value);

/// The type as it was made; Unset for none alone.
inline ValueType declaredType(MetaObj::MetaObject const *value) {
    if (value == nullptr) {
        return ValueType::Unset;
    }
    std::type_info const *const type = &typeid(*value); // one object a class: no names need be compared
    if (type == &typeid(MetaObj::MetaString)) {
        return ValueType::Text;
    }
    if (type == &typeid(MetaObj::MetaInt)) {
        return ValueType::Number;
    }
    if (type == &typeid(MetaObj::MetaBool)) {
        return ValueType::Boolean;
    }
    if (type == &typeid(MetaObj::MetaList)) {
        return ValueType::List;
    }
    return type == &typeid(MetaObj::MetaStruct) ? ValueType::Struct : typeOfDerived(value);
}

inline ValueType typeOf(MetaObj::MetaObject const *value) {
    ValueType const type = declaredType(value);
    bool const isScalar = type == ValueType::Text || type == ValueType::Number || type == ValueType::Boolean;
    return isScalar && !value->IsSet() ? ValueType::Unset : type;
}

/// What a value is, or, where there is none, what its schema declares.
enum class Kind { Nothing, Scalar, Number, ScalarList, StructList, Struct };
Kind kindOf(MetaObj::MetaObject const *value, MetaObj::MetaObject const *schema);

/// False for a value that is absent or a scalar that was never set.
bool isSet(Object const &value);

/// A scalar's text as it came: not escaped, without unit. Empty for a value that is not set or no scalar.
std::string scalarText(MetaObj::MetaObject const *value);

/// The schema of a list's elements: what the list's own schema declares, else what the list was made with.
Object elementSchema(MetaObj::MetaList const *list, MetaObj::MetaObject const *schema);

/// Sees to it that every format can walk through a value to its end.
/// @throws FormatError when it holds a value of a kind that is none of MetaObj's, or nests deeper than 64
/// @param field as for refuse
void checkShape(MetaObj::MetaObject const *value, std::string const &format, std::string const *field = nullptr);

constexpr std::size_t deepestNesting = 64;
constexpr char const *isNestedTooDeep = "is nested deeper than 64 levels";
constexpr char const *isOfUnknownKind = "is of a kind that it does not know";

/// @param field the name of the field that the value stands in; null when it stands in none
/// @throws FormatError
[[noreturn]] void refuse(std::string const &format, std::string const *field, char const *why);

/// A field of a structure and what it is declared as: part of a schema that outlives the plan, or null.
struct FieldPlan {
    static constexpr std::size_t nowhere = static_cast<std::size_t>(-1);

    std::string name;
    MetaObj::MetaObject const *schema = nullptr;
    std::string unit;
    std::string label;           ///< the name as the format writes it
    std::size_t index = nowhere; ///< its place in the structure that the plan was made for
};

/// The fields of a structure that are shown, in order: the declared ones in declared order, then what the value holds
/// beyond them, unless a choice says otherwise. Names that are no field's are passed over.
using StructurePlan = std::vector<FieldPlan>;

/// The value of a planned field; null when the structure has none.
inline MetaObj::MetaObject const *valueOf(MetaObj::MetaStruct::Fields const &fields, FieldPlan const &field) {
    return field.index == FieldPlan::nowhere ? nullptr : fields.value(field.index);
}

inline MetaObj::MetaObject const *valueOf(MetaObj::MetaStruct const &structure, FieldPlan const &field) {
    return valueOf(structure.ViewFields(), field);
}

/// The value of a field; null when there is none of that name.
MetaObj::MetaObject const *findValue(MetaObj::MetaStruct::Fields const &fields, std::string const &name);

/// The same for a structure that the plan may not have been made for.
MetaObj::MetaObject const *findValue(MetaObj::MetaStruct const &structure, FieldPlan const &field);

/// Adds the fields that a plan lacks, at its end.
void merge(StructurePlan &plan, StructurePlan const &more);

/// Which fields are chosen of a structure; nothing for all of them.
using Choice = std::function<std::optional<std::vector<std::string>>(std::string const &structure)>;

/// Plans for the structures of a result. A long list has one plan, made at its first element and again where an
/// element's fields differ from those of the one before.
class StructurePlans {
public:
    using Label = std::string (*)(std::string const &name);

    /// @param settings for the units; must outlive this
    /// @param label    how the format writes a field's name
    StructurePlans(FormatSettings const &settings, Choice choice, Label label);

    /// @param schema what the structure is declared as; may be null
    std::shared_ptr<StructurePlan const> planOf(MetaObj::MetaStruct const &structure,
                                                MetaObj::MetaObject const *schema);

private:
    struct Known {
        std::string structure; ///< name of the value that the plan was made for
        std::vector<std::string> names;
        void const *shared = nullptr; ///< the names themselves; other structures may share them
        std::shared_ptr<StructurePlan const> plan;
    };

    StructurePlan made(MetaObj::MetaStruct const &structure, MetaObj::MetaObject const *schema) const;

    FormatSettings const &settings_;
    Choice choice_;
    Label label_;
    std::map<MetaObj::MetaObject const *, Known> known_; // by schema
    MetaObj::MetaObject const *lastSchema_ = nullptr;
    Known *last_ = nullptr;
};

} // namespace Plexa
