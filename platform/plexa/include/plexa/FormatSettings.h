// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "plexa/Display.h"
#include "plexa/MetaObj.h"

namespace Plexa {

/// What a command, and behind it the user, asks of a formatter: keys and values, the last one set counts.
///
///   fields:<structure>          names of the fields to show, in this order, separated by commas
///   header:<structure>          a text whose %Field% parts are replaced; heads each structure
///   table-columns               the columns of the outermost table, separated by commas
///   units:<structure>.<field>   the unit shown behind a value
class FormatSettings {
public:
    /// What formats for people write to.
    void setDisplay(Display const &display) {
        display_ = display;
    }
    Display const &display() const {
        return display_;
    }

    void set(std::string const &key, std::string const &value);

    /// A key=value of the user's. @throws UsageError for a text that is none of the forms above.
    void setFromUser(std::string const &assignment);

    /// The same for a result that is declared so; the schema may be empty.
    /// @throws UsageError for a structure or field that it does not declare, too
    void setFromUser(std::string const &assignment, boost::shared_ptr<MetaObj::MetaObject> const &schema);

    /// The user's choice of fields for the outermost structure; machine formats honour this one alone.
    /// @param declared the structure's fields; empty when it declares none
    /// @throws UsageError for a name that is not declared, or that stands twice
    void chooseFields(std::string const &structure, std::string const &names, std::vector<std::string> const &declared);

    std::optional<std::vector<std::string>> fields(std::string const &structure) const;
    std::optional<std::vector<std::string>> tableColumns() const;
    std::optional<std::vector<std::string>> chosenFields() const;
    /// The heading of a structure, as it came; empty when none is asked for.
    std::string header(MetaObj::MetaStruct const &structure) const;
    std::string unit(std::string const &structure, std::string const &field) const;

private:
    std::string const *find(std::string const &key) const;

    std::vector<std::pair<std::string, std::string>> pairs_;
    std::optional<std::vector<std::string>> chosen_;
    Display display_;
};

} // namespace Plexa
