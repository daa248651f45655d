// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Samples.h"
#include "plexa/UsageError.h"

namespace {

using namespace Samples;
using Plexa::FormatSettings;
using Plexa::UsageError;

template <typename Call>
std::string mistakeOf(Call const &call) {
    try {
        call();
    } catch (UsageError const &mistake) {
        return mistake.sentence();
    }
    return "no mistake";
}

TEST(FormatSettings, HeaderReplacesFieldsBetweenPercentSigns) {
    auto const gold = container("gold", 7, {});
    EXPECT_EQ(settings({{"header:Container", "%Container Name%"}}).header(*gold), "gold");
    EXPECT_EQ(settings({{"header:Container", "<%Container Name%> of %Max Size%!"}}).header(*gold), "<gold> of 7!");
    EXPECT_EQ(settings({{"header:Container", "%No Such Field%"}}).header(*gold), "");
    EXPECT_EQ(settings({{"header:Container", "50% off"}}).header(*gold), "50% off");
    EXPECT_EQ(settings({{"header:Other", "%Container Name%"}}).header(*gold), "");
}

TEST(FormatSettings, LastValueOfAKeyCounts) {
    auto const made = settings({{"fields:A", "x"}, {"fields:A", "y, z"}});
    EXPECT_EQ(made.fields("A"), (std::vector<std::string>{"y", "z"}));
    EXPECT_FALSE(made.fields("B").has_value());
}

TEST(FormatSettings, UserAssignmentsAreChecked) {
    FormatSettings made;
    made.setFromUser("units:S.A Field=MB");
    EXPECT_EQ(made.unit("S", "A Field"), "MB");
    std::string const forms = " is none of fields:<structure>=..., header:<structure>=..., table-columns=..., "
                              "units:<structure>.<field>=...";
    for (char const *wrong : {"colour=red", "fields:=x", "fields:S", "units:S=MB", ""}) {
        EXPECT_EQ(mistakeOf([&] { made.setFromUser(wrong); }), "--format-param: '" + std::string(wrong) + "'" + forms);
    }
}

TEST(FormatSettings, UserAssignmentsNameWhatTheResultDeclares) {
    auto const schema = containersSchema();
    FormatSettings made;
    for (char const *right : {"fields:Container=Ready, Container Name", "fields:Array=ArrayId", "table-columns=Ready",
                              "header:Array=%ArrayId% of 100%", "units:Container.Max Size=MB"}) {
        EXPECT_EQ(mistakeOf([&] { made.setFromUser(right, schema); }), "no mistake") << right;
    }
    EXPECT_EQ(mistakeOf([&] { made.setFromUser("fields:Containr=Ready", schema); }),
              "--format-param: 'Containr' is no structure of the result; did you mean 'Container'?; there is 'Array', "
              "'Container'");
    std::string const fields = "; there is 'Container Name', 'Max Size', 'Ready', 'Arrays'";
    EXPECT_EQ(mistakeOf([&] { made.setFromUser("table-columns=Ready,ArrayId", schema); }),
              "--format-param: 'ArrayId' is no field of 'Container'; did you mean 'Arrays'?" + fields);
    EXPECT_EQ(mistakeOf([&] { made.setFromUser("header:Container=%Redy%", schema); }),
              "--format-param: 'Redy' is no field of 'Container'; did you mean 'Ready'?" + fields);
    EXPECT_EQ(mistakeOf([&] { made.setFromUser("units:Container.Size=MB", schema); }),
              "--format-param: 'Size' is no field of 'Container'" + fields);
    EXPECT_EQ(mistakeOf([&] { made.setFromUser("table-columns=x", MetaBool::New()); }),
              "--format-param: the result of this command has no fields");
}

TEST(FormatSettings, ChosenFieldsMustBeDeclared) {
    FormatSettings made;
    EXPECT_EQ(mistakeOf([&] {
                  made.chooseFields("S", "Name,Nmae", {"Name", "Size"});
              }),
              "--fields: 'Nmae' is no field of the result; did you mean 'Name'?; there is 'Name', 'Size'");
    EXPECT_EQ(mistakeOf([&] { made.chooseFields("S", "a, b,a", {"a", "b"}); }), "--fields: 'a' is named twice");
    EXPECT_EQ(mistakeOf([&] { made.chooseFields("S", " , ", {"a"}); }), "--fields: no name given; there is 'a'");
    EXPECT_EQ(mistakeOf([&] { made.chooseFields("S", "b", {"b\x1b"}); }),
              "--fields: 'b' is no field of the result; did you mean 'b\\x1b'?; there is 'b\\x1b'");
    EXPECT_EQ(mistakeOf([&] { made.chooseFields("", "a", {}); }), "--fields: the result of this command has no fields");
    made.chooseFields("S", "b", {"a", "b"});
    EXPECT_EQ(made.fields("S"), (std::vector<std::string>{"b"}));
    EXPECT_EQ(made.tableColumns(), (std::vector<std::string>{"b"}));
    EXPECT_EQ(made.chosenFields(), (std::vector<std::string>{"b"}));
}

TEST(FormatSettings, UnknownFormatSaysWhatThereIs) {
    EXPECT_EQ(
        mistakeOf([] { Plexa::requireFormat("yml", "--format"); }),
        "--format: unknown format 'yml'; did you mean 'yaml' or 'xml'?; there is simple, table, tree, json, yaml, xml, "
        "csv, keyvalue");
}

} // namespace
