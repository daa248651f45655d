// SPDX-License-Identifier: Apache-2.0
//
// What the formats for programs look like. That they hold every value is shown in formats/, by other parsers.
#include <gtest/gtest.h>

#include "Samples.h"

namespace {

using namespace Samples;

Plexa::Result oneContainer() {
    auto const sparse = container("yes", 4096, {array("a-1", {"PE #0"})});
    sparse->SetField("Ready", MetaBool::New());
    return containers({sparse});
}

TEST(Yaml, BlocksAndQuotesWhereAnotherTypeCouldBeRead) {
    EXPECT_EQ(format("yaml", oneContainer()), "---\n"
                                              "- Container Name: \"yes\"\n"
                                              "  Max Size: 4096\n"
                                              "  Ready: null\n"
                                              "  Arrays:\n"
                                              "    - ArrayId: a-1\n"
                                              "      Name: Lab a-1\n"
                                              "      PEInfo:\n"
                                              "        - \"PE #0\"\n");
    EXPECT_EQ(format("yaml", containers({})), "---\n[]\n");
    EXPECT_EQ(format("yaml", {MetaString::New("a\x1b"), nullptr}), "---\n\"a\\x1b\"\n");
}

TEST(Xml, AnElementForEachValueNamedAfterItsType) {
    EXPECT_EQ(format("xml", oneContainer()), "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                                             "<result>\n"
                                             "  <list>\n"
                                             "    <record type=\"Container\">\n"
                                             "      <text key=\"Container Name\">yes</text>\n"
                                             "      <int key=\"Max Size\">4096</int>\n"
                                             "      <null key=\"Ready\"/>\n"
                                             "      <list key=\"Arrays\">\n"
                                             "        <record type=\"Array\">\n"
                                             "          <text key=\"ArrayId\">a-1</text>\n"
                                             "          <text key=\"Name\">Lab a-1</text>\n"
                                             "          <list key=\"PEInfo\">\n"
                                             "            <text>PE #0</text>\n"
                                             "          </list>\n"
                                             "        </record>\n"
                                             "      </list>\n"
                                             "    </record>\n"
                                             "  </list>\n"
                                             "</result>\n");
}

TEST(Xml, fault_64_WhatXmlCannotHoldIsBase64AndSaysSo) {
    EXPECT_EQ(format("xml", {MetaString::New("a\x1b"), nullptr}),
              "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
              "<result>\n  <text encoding=\"base64\">YRs=</text>\n</result>\n");
    EXPECT_EQ(format("xml", {MetaString::New("\xE2\x80\xAE]]>\r\xff"), nullptr}),
              "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
              "<result>\n  <text>&#8238;]]&gt;&#13;\\xff</text>\n</result>\n");
}

TEST(Csv, AHeaderAndALineForEachStructure) {
    EXPECT_EQ(format("csv", oneContainer()), "Container Name,Max Size,Ready,Arrays\r\n"
                                             "yes,4096,,\"[{\"\"ArrayId\"\":\"\"a-1\"\",\"\"Name\"\":\"\"Lab "
                                             "a-1\"\",\"\"PEInfo\"\":[\"\"PE #0\"\"]}]\"\r\n");
    EXPECT_EQ(format("csv", containers({})), "Container Name,Max Size,Ready,Arrays\r\n");
    EXPECT_EQ(format("csv", {MetaBool::New(true), MetaBool::New()}), "result\r\ntrue\r\n");
}

TEST(Csv, fault_64_TextIsQuotedAndEscaped) {
    EXPECT_EQ(format("csv", {MetaString::New("a,\"b\"\nc\\d\r\x1b"), nullptr}),
              "result\r\n\"a,\"\"b\"\"\nc\\\\d\\r\\x1b\"\r\n");
    EXPECT_EQ(format("csv", {MetaString::New(""), nullptr}), "result\r\n\"\"\r\n"); // unset is an empty cell
}

TEST(KeyValue, ALineForEachValueWithItsPath) {
    EXPECT_EQ(format("keyvalue", oneContainer()), "[0].Container Name=\"yes\"\n"
                                                  "[0].Max Size=4096\n"
                                                  "[0].Ready=null\n"
                                                  "[0].Arrays[0].ArrayId=\"a-1\"\n"
                                                  "[0].Arrays[0].Name=\"Lab a-1\"\n"
                                                  "[0].Arrays[0].PEInfo[0]=\"PE #0\"\n");
    EXPECT_EQ(format("keyvalue", {MetaBool::New(true), MetaBool::New()}), "result=true\n");
    EXPECT_EQ(format("keyvalue", containers({})), "result=[]\n");
}

TEST(KeyValue, NamesThatCouldBeReadOtherwiseAreQuoted) {
    auto const odd = MetaStruct::New("Odd");
    odd->SetField("a.b", 1);
    odd->SetField("result", 2);
    odd->SetField("x=y", 3);
    EXPECT_EQ(format("keyvalue", {odd, nullptr}), "\"a.b\"=1\n\"result\"=2\n\"x=y\"=3\n");
}

/// A value of a kind that a plug-in made up.
class Strange : public Plexa::MetaObj::MetaObject {};

std::string refusalOf(char const *name, boost::shared_ptr<Plexa::MetaObj::MetaObject> const &value) {
    Plexa::StringSink sink;
    try {
        Plexa::requireFormat(name, "--format").write({value, nullptr}, {}, sink);
    } catch (Plexa::FormatError const &error) {
        EXPECT_TRUE(sink.text().find("fine") == std::string::npos) << "half of a value: " << sink.text();
        return error.sentence();
    }
    return "written: " + sink.text();
}

TEST(Formats, WhatNoneCanHoldIsRefusedBeforeItsFirstByte) {
    auto const list = MetaList::New(Plexa::MetaObj::StructList);
    list->Append(MetaString::New("fine"));
    list->Append(boost::shared_ptr<Plexa::MetaObj::MetaObject>(new Strange));
    auto const structure = MetaStruct::New("Holder");
    structure->SetField("Odd", list);
    auto const endless = MetaList::New(Plexa::MetaObj::StructList);
    endless->Append(MetaString::New("round"));
    auto const deep = MetaStruct::New("Deep");
    deep->SetField("Down", endless);
    for (char const *name : {"simple", "table", "tree", "json", "yaml", "xml", "csv", "keyvalue"}) {
        EXPECT_EQ(refusalOf(name, structure), "the format " + std::string(name) +
                                                  " cannot hold the result: the field 'Odd' is of a kind that it does "
                                                  "not know");
    }
    boost::shared_ptr<Plexa::MetaObj::MetaObject> nested = deep;
    for (int i = 0; i < 70; ++i) {
        auto const around = MetaList::New(Plexa::MetaObj::StructList);
        around->Append(nested);
        nested = around;
    }
    EXPECT_EQ(refusalOf("json", nested),
              "the format json cannot hold the result: its value is nested deeper than 64 levels");
}

} // namespace
