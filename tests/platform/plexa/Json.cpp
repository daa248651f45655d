// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <rapidjson/document.h>

#include "Samples.h"
#include "plexa/JsonText.h"
#include "plexa/Text.h"

namespace {

using namespace Samples;

TEST(Json, ScalarsAreValues) {
    EXPECT_EQ(format("json", {MetaBool::New(true), MetaBool::New()}), "true\n");
    EXPECT_EQ(format("json", {MetaInt::New(INT64_MIN), MetaInt::New()}), "-9223372036854775808\n");
    EXPECT_EQ(format("json", {MetaString::New("a\"b"), MetaString::New()}), "\"a\\\"b\"\n");
    EXPECT_EQ(format("json", {MetaString::New(), MetaString::New()}), "null\n");
}

TEST(Json, EmptyListIsAnEmptyArray) {
    EXPECT_EQ(format("json", containers({})), "[]\n");
}

TEST(Json, EveryDeclaredFieldStandsInDeclaredOrderAndUnsetIsNull) {
    auto const sparse = MetaStruct::New("Container");
    sparse->SetField("Ready", false);
    sparse->SetField("Container Name", "x");
    EXPECT_EQ(format("json", containers({sparse})), "[\n"
                                                    "  {\n"
                                                    "    \"Container Name\": \"x\",\n"
                                                    "    \"Max Size\": null,\n"
                                                    "    \"Ready\": false,\n"
                                                    "    \"Arrays\": null\n"
                                                    "  }\n"
                                                    "]\n");
}

TEST(Json, NestsAndIgnoresWhatACommandAsksOfHumanFormats) {
    auto const formatting = settings({{"fields:Container", "Ready"},
                                      {"units:Container.Max Size", "MB"},
                                      {"header:Array", "%ArrayId%"},
                                      {"table-columns", "Ready"}});
    EXPECT_EQ(format("json", containers({container("gold", 1, {array("a", {"PE"})})}), formatting),
              "[\n"
              "  {\n"
              "    \"Container Name\": \"gold\",\n"
              "    \"Max Size\": 1,\n"
              "    \"Ready\": true,\n"
              "    \"Arrays\": [\n"
              "      {\n"
              "        \"ArrayId\": \"a\",\n"
              "        \"Name\": \"Lab a\",\n"
              "        \"PEInfo\": [\n"
              "          \"PE\"\n"
              "        ]\n"
              "      }\n"
              "    ]\n"
              "  }\n"
              "]\n");
}

TEST(Json, TheUsersChoiceOfFieldsCounts) {
    Plexa::FormatSettings formatting;
    formatting.chooseFields("Container", "Ready,Container Name", containerSchema()->GetFieldNames());
    EXPECT_EQ(format("json", {container("gold", 1, {}), containerSchema()}, formatting),
              "{\n  \"Ready\": true,\n  \"Container Name\": \"gold\"\n}\n");
}

TEST(Json, fault_64_HostileTextStaysOneValidDocument) {
    std::string const hostile("\x1b[2J\r\n\t\"\\\xE2\x80\xAE\xC2\x9B\xff\xF3\xA0\x80\x81\0end", 22);
    std::string const text = format("json", {MetaString::New(hostile), MetaString::New()});
    rapidjson::Document document;
    document.Parse<rapidjson::kParseValidateEncodingFlag>(text.c_str());
    ASSERT_FALSE(document.HasParseError()) << text;
    std::string const read(document.GetString(), document.GetStringLength());
    EXPECT_EQ(read, std::string("\x1b[2J\r\n\t\"\\\xE2\x80\xAE\xC2\x9B\\xff\xF3\xA0\x80\x81\0end", 25));
    for (char const c : text.substr(0, text.size() - 1)) {
        EXPECT_TRUE(c >= ' ' && c < '\x7f') << "acts on a terminal: " << Plexa::escaped(text);
    }
}

TEST(Json, OrdinaryTextIsLeftReadable) {
    EXPECT_EQ(Plexa::jsonText("Größe 金"), "\"Größe 金\"");
}

} // namespace
