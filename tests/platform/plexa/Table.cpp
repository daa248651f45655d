// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Samples.h"

namespace {

using namespace Samples;

TEST(Table, RowsAndColumnsWithNumbersToTheRight) {
    auto const formatting = settings({{"table-columns", "Container Name,Max Size,Ready"}});
    EXPECT_EQ(format("table", twoContainers(), formatting), "Container Name  Max Size  Ready\n"
                                                            "--------------  --------  -----\n"
                                                            "gold                4096  true\n"
                                                            "silver             65536  true\n");
}

TEST(Table, ListOfStructuresBecomesAnIndentedTable) {
    auto const formatting =
        settings({{"table-columns", "Container Name,Max Size,Arrays"}, {"header:Container", "%Container Name%"}});
    EXPECT_EQ(format("table", twoContainers(), formatting), "Container Name  Max Size\n"
                                                            "--------------  --------\n"
                                                            "gold                4096\n"
                                                            "  Arrays of gold:\n"
                                                            "    ArrayId  Name     PEInfo\n"
                                                            "    -------  -------  ------\n"
                                                            "    a-1      Lab a-1  PE #0\n"
                                                            "                      PE #1\n"
                                                            "    a-2      Lab a-2\n"
                                                            "silver             65536\n");
}

TEST(Table, FieldsOfAStructureCountWhereNoColumnsAreNamed) {
    auto const formatting = settings({{"fields:Container", "Ready,Container Name"}});
    EXPECT_EQ(format("table", twoContainers(), formatting), "Ready  Container Name\n"
                                                            "-----  --------------\n"
                                                            "true   gold\n"
                                                            "true   silver\n");
}

TEST(Table, OneStructureIsOneRow) {
    auto const formatting = settings({{"table-columns", "Max Size"}, {"units:Container.Max Size", "MB"}});
    EXPECT_EQ(format("table", {container("x", 5, {}), containerSchema()}, formatting), "Max Size\n"
                                                                                       "--------\n"
                                                                                       "    5 MB\n");
}

TEST(Table, EmptyListHasColumnsAndNoRows) {
    EXPECT_EQ(format("table", containers({}), settings({{"table-columns", "Container Name,Max Size"}})),
              "Container Name  Max Size\n--------------  --------\n");
}

TEST(Table, UnsetCellIsEmptyAndNoLineEndsInBlanks) {
    auto const sparse = containerSchema();
    sparse->SetField("Container Name", "x");
    EXPECT_EQ(format("table", containers({sparse}), settings({{"table-columns", "Container Name,Ready,Max Size"}})),
              "Container Name  Ready  Max Size\n"
              "--------------  -----  --------\n"
              "x\n");
}

TEST(Table, WhatIsNoTableIsPrintedPlainly) {
    EXPECT_EQ(format("table", {MetaBool::New(true), MetaBool::New()}), "true\n");
    auto const list = MetaList::New(Plexa::MetaObj::StringList);
    list->Append(MetaString::New("one"));
    list->Append(MetaString::New("two"));
    EXPECT_EQ(format("table", {list, nullptr}), "one\ntwo\n");
}

TEST(Table, WideCharactersTakeTheirColumns) {
    EXPECT_EQ(format("table", containers({container("金", 1, {}), container("e\xCC\x81t\xC3\xA9", 2, {})}),
                     settings({{"table-columns", "Container Name,Max Size"}})),
              "Container Name  Max Size\n"
              "--------------  --------\n"
              "金                     1\n"
              "e\xCC\x81t\xC3\xA9                    2\n");
}

TEST(Table, fault_64_CellsAreEscapedAndKeepTheirColumns) {
    EXPECT_EQ(format("table", containers({container("a\r\x1b]0;t\x07", 1, {})}),
                     settings({{"table-columns", "Container Name,Max Size"}})),
              "Container Name   Max Size\n"
              "---------------  --------\n"
              "a\\r\\x1b]0;t\\x07         1\n");
}

} // namespace
