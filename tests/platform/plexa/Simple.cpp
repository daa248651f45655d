// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Samples.h"

namespace {

using namespace Samples;

TEST(Simple, ScalarIsALine) {
    EXPECT_EQ(format("simple", {MetaBool::New(true), MetaBool::New()}), "true\n");
    EXPECT_EQ(format("simple", {MetaBool::New(false), MetaBool::New()}), "false\n");
    EXPECT_EQ(format("simple", {MetaInt::New(-7), MetaInt::New()}), "-7\n");
    EXPECT_EQ(format("simple", {MetaString::New("done"), MetaString::New()}), "done\n");
}

TEST(Simple, TextThatBringsItsLineEndIsALineToo) {
    EXPECT_EQ(format("simple", {MetaString::New("done\n"), MetaString::New()}), "done\n");
    EXPECT_EQ(format("simple", {MetaString::New("a\nb\n"), MetaString::New()}), "a\\nb\n");
}

TEST(Simple, UnsetOrAbsentValueIsNothing) {
    EXPECT_EQ(format("simple", {MetaString::New(), MetaString::New()}), "");
    EXPECT_EQ(format("simple", {nullptr, MetaString::New()}), "");
    EXPECT_EQ(format("simple", {nullptr, nullptr}), "");
}

TEST(Simple, ListOfStringsIsOnePerLine) {
    auto const list = MetaList::New(Plexa::MetaObj::StringList);
    list->Append(MetaString::New("one"));
    list->Append(MetaString::New("two"));
    EXPECT_EQ(format("simple", {list, nullptr}), "one\ntwo\n");
}

TEST(Simple, StructuresAreHeadedAndNestedListsIndented) {
    auto const formatting = settings({{"header:Container", "%Container Name%"}, {"header:Array", "%ArrayId%"}});
    EXPECT_EQ(format("simple", twoContainers(), formatting), "gold\n"
                                                             "  Container Name: gold\n"
                                                             "  Max Size: 4096\n"
                                                             "  Ready: true\n"
                                                             "  Arrays:\n"
                                                             "    a-1\n"
                                                             "      ArrayId: a-1\n"
                                                             "      Name: Lab a-1\n"
                                                             "      PEInfo:\n"
                                                             "        PE #0\n"
                                                             "        PE #1\n"
                                                             "    a-2\n"
                                                             "      ArrayId: a-2\n"
                                                             "      Name: Lab a-2\n"
                                                             "      PEInfo:\n"
                                                             "\n"
                                                             "silver\n"
                                                             "  Container Name: silver\n"
                                                             "  Max Size: 65536\n"
                                                             "  Ready: true\n"
                                                             "  Arrays:\n");
}

TEST(Simple, WithoutHeaderABlankLineParts) {
    auto const formatting = settings({{"fields:Container", "Container Name,Arrays"}, {"fields:Array", "Name"}});
    EXPECT_EQ(format("simple", twoContainers(), formatting), "Container Name: gold\n"
                                                             "Arrays:\n"
                                                             "  Name: Lab a-1\n"
                                                             "\n"
                                                             "  Name: Lab a-2\n"
                                                             "\n"
                                                             "Container Name: silver\n"
                                                             "Arrays:\n");
}

TEST(Simple, FieldsChooseAndOrderAndUnitsFollow) {
    auto const formatting =
        settings({{"fields:Container", "Max Size,Container Name,No Such Field"}, {"units:Container.Max Size", "MB"}});
    EXPECT_EQ(format("simple", {container("gold", 12, {}), containerSchema()}, formatting),
              "Max Size: 12 MB\nContainer Name: gold\n");
}

TEST(Simple, UnsetFieldsAreLeftOut) {
    auto const sparse = containerSchema();
    sparse->SetField("Max Size", 0);
    auto const formatting = settings({{"fields:Container", "Container Name,Max Size,Ready"}});
    EXPECT_EQ(format("simple", {sparse, containerSchema()}, formatting), "Max Size: 0\n");
}

TEST(Simple, EmptyListPrintsNothing) {
    EXPECT_EQ(format("simple", containers({})), "");
}

TEST(Simple, fault_64_WhatOthersWroteIsEscaped) {
    auto const formatting =
        settings({{"fields:Container", "Container Name"}, {"header:Container", "%Container Name%"}});
    EXPECT_EQ(format("simple", {container("a\x1b[31m\nb\xE2\x80\xAE\xff", 1, {}), containerSchema()}, formatting),
              "a\\x1b[31m\\nb\\u202e\\xff\n  Container Name: a\\x1b[31m\\nb\\u202e\\xff\n");
}

} // namespace
