// SPDX-License-Identifier: Apache-2.0
//
// Trees, and what formats for people do on a terminal.
#include <gtest/gtest.h>

#include <map>

#include "Samples.h"
#include "plexa/Text.h"

namespace {

using namespace Samples;
using Plexa::Display;
using Plexa::displayOf;

Plexa::FormatSettings on(Display const &display, std::vector<std::pair<std::string, std::string>> const &pairs = {}) {
    Plexa::FormatSettings made = settings(pairs);
    made.setDisplay(display);
    return made;
}

TEST(TreeFormat, JoinsNodesByLinesAndLeavesOutWhatIsNotSet) {
    auto const gold = container("gold", 4096, {array("a-1", {"PE #0", "PE #1"}), array("a-2", {})});
    gold->SetField("Ready", MetaBool::New());
    EXPECT_EQ(format("tree", containers({gold, container("silver", 1, {})}),
                     settings({{"header:Container", "%Container Name%"}, {"units:Container.Max Size", "MB"}})),
              "gold\n"
              "├── Container Name: gold\n"
              "├── Max Size: 4096 MB\n"
              "└── Arrays\n"
              "    ├── Array\n"
              "    │   ├── ArrayId: a-1\n"
              "    │   ├── Name: Lab a-1\n"
              "    │   └── PEInfo\n"
              "    │       ├── PE #0\n"
              "    │       └── PE #1\n"
              "    └── Array\n"
              "        ├── ArrayId: a-2\n"
              "        ├── Name: Lab a-2\n"
              "        └── PEInfo\n"
              "silver\n"
              "├── Container Name: silver\n"
              "├── Max Size: 1 MB\n"
              "├── Ready: true\n"
              "└── Arrays\n");
}

TEST(TreeFormat, AValueIsALine) {
    EXPECT_EQ(format("tree", {MetaBool::New(true), MetaBool::New()}), "true\n");
    EXPECT_EQ(format("tree", containers({})), "");
}

TEST(TreeFormat, DrawsWithAsciiOnADumbTerminal) {
    Display dumb;
    dumb.plain = true;
    EXPECT_EQ(format("tree", {array("a", {"p"}), arraySchema()}, on(dumb)), "Array\n"
                                                                            "|-- ArrayId: a\n"
                                                                            "|-- Name: Lab a\n"
                                                                            "`-- PEInfo\n"
                                                                            "    `-- p\n");
}

TEST(TreeFormat, fault_64_NodesAreEscaped) {
    EXPECT_EQ(format("tree", {MetaString::New("a\x1b[2J\xE2\x80\xAE\xff"), nullptr}), "a\\x1b[2J\\u202e\\xff\n");
}

TEST(TableOnATerminal, WidestColumnsAreBrokenToTheWidth) {
    auto const text = container("a name of several words", 4096, {});
    auto const formatting = on({30, false, false}, {{"table-columns", "Container Name,Max Size,Ready"}});
    EXPECT_EQ(format("table", containers({text, container("3f1a52de-6c1b-4b57", 1, {})}), formatting),
              "Container      Max Size  Ready\n"
              "Name\n"
              "-------------  --------  -----\n"
              "a name of          4096  true\n"
              "several words\n"
              "3f1a52de-6c1b         1  true\n"
              "-4b57\n");
}

TEST(TableOnATerminal, FitsOrStaysReadable) {
    auto const formatting = [](std::size_t width) {
        return on({width, false, false}, {{"table-columns", "Container Name,Max Size,Ready"}});
    };
    Plexa::Result const result = containers({container("金額金額金額金額 and e\xCC\x81t\xC3\xA9 😀😀😀😀", 1, {})});
    for (std::size_t width = 1; width < 70; ++width) {
        std::string const text = format("table", result, formatting(width));
        std::size_t widest = 0;
        for (std::size_t begin = 0; begin < text.size(); begin = text.find('\n', begin) + 1) {
            widest = std::max(widest, Plexa::displayWidth(text.substr(begin, text.find('\n', begin) - begin)));
        }
        EXPECT_LE(widest, std::max<std::size_t>(width, 8 + 2 + 8 + 2 + 5)) << text; // the least that columns shrink to
    }
}

TEST(TableOnATerminal, NestedTablesFitBehindTheirIndentation) {
    auto const formatting = on({40, false, false}, {{"table-columns", "Container Name,Arrays"}});
    EXPECT_EQ(format("table",
                     containers({container("gold", 1, {array("a-1", {"PE #0 (localUID: x, isAccessible: 1)"})})}),
                     formatting),
              "Container Name\n"
              "--------------\n"
              "gold\n"
              "  Arrays:\n"
              "    ArrayId  Name     PEInfo\n"
              "    -------  -------  ------------------\n"
              "    a-1      Lab a-1  PE #0 (localUID:\n"
              "                      x, isAccessible:\n"
              "                      1)\n");
}

TEST(Colour, HeadingsAndLabelsAloneAndNothingOffATerminal) {
    Display const terminal{0, true, false};
    EXPECT_EQ(format("simple", {container("gold", 1, {}), containerSchema()},
                     on(terminal, {{"header:Container", "%Container Name%"}, {"fields:Container", "Max Size"}})),
              "\x1b[1mgold\x1b[0m\n  \x1b[36mMax Size:\x1b[0m 1\n");
    EXPECT_EQ(format("table", containers({container("gold", 1, {})}), on(terminal, {{"table-columns", "Max Size"}})),
              "\x1b[1mMax Size\x1b[0m\n--------\n       1\n");
    EXPECT_EQ(
        format("tree", {container("gold", 1, {}), containerSchema()}, on(terminal, {{"fields:Container", "Max Size"}})),
        "\x1b[1mContainer\x1b[0m\n└── \x1b[36mMax Size:\x1b[0m 1\n");
    for (char const *machine : {"json", "yaml", "xml", "csv", "keyvalue"}) {
        EXPECT_EQ(format(machine, twoContainers(), on({20, true, true})), format(machine, twoContainers()));
    }
}

/// What the tool finds out about a terminal of 100 columns under these variables.
Display terminalUnder(std::map<std::string, std::string> const &variables, bool isTerminal = true) {
    return displayOf(isTerminal, 100, [&variables](std::string const &name) {
        auto const found = variables.find(name);
        return found != variables.end() ? std::optional(found->second) : std::nullopt;
    });
}

TEST(Display, ColourTakesATerminalThatCanAndAUserWhoWants) {
    EXPECT_TRUE(terminalUnder({{"TERM", "xterm"}}).colour);
    EXPECT_TRUE(terminalUnder({{"TERM", "xterm"}, {"NO_COLOR", ""}}).colour);
    EXPECT_FALSE(terminalUnder({{"TERM", "xterm"}, {"NO_COLOR", "1"}}).colour);
    EXPECT_FALSE(terminalUnder({{"TERM", "dumb"}}).colour);
    EXPECT_FALSE(terminalUnder({}).colour);
    EXPECT_FALSE(terminalUnder({{"TERM", "xterm"}}, false).colour);
    EXPECT_TRUE(terminalUnder({{"TERM", "dumb"}}).plain);
    EXPECT_FALSE(terminalUnder({{"TERM", "dumb"}}, false).plain);
}

TEST(Display, WidthIsTheUsersElseTheTerminalsAndNoneElsewhere) {
    EXPECT_EQ(terminalUnder({}).width, 100U);
    EXPECT_EQ(terminalUnder({{"COLUMNS", "40"}}).width, 40U);
    for (char const *nonsense : {"", "0", "-1", "40x", " 40", "10001", "99999999999999999999"}) {
        EXPECT_EQ(terminalUnder({{"COLUMNS", nonsense}}).width, 100U) << nonsense;
    }
    EXPECT_EQ(terminalUnder({{"COLUMNS", "40"}}, false).width, 0U);
}

} // namespace
