// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "plexa/CallSpec.h"

namespace {

using namespace Plexa::MetaObj;
using Plexa::CallSpec::Input;
using Plexa::CallSpec::Output;
using Plexa::CallSpec::ParameterSpec;

TEST(Values, ScalarsKnowWhetherTheyAreSet) {
    EXPECT_FALSE(MetaBool::New()->IsSet());
    EXPECT_FALSE(MetaInt::New()->IsSet());
    EXPECT_FALSE(MetaString::New()->IsSet());
    EXPECT_FALSE(MetaBool::New()->GetValue());
    EXPECT_EQ(MetaInt::New()->GetValue(), 0);
    EXPECT_EQ(MetaString::New()->GetValue(), "");
    EXPECT_TRUE(MetaBool::New(false)->IsSet());
    EXPECT_TRUE(MetaInt::New(0)->IsSet());
    EXPECT_TRUE(MetaString::New("")->IsSet());
    EXPECT_TRUE(MetaList::New(StringList)->IsSet());
    EXPECT_TRUE(MetaStruct::New("S")->IsSet());
}

TEST(Values, FieldsTakeTheKindOfWhatIsGiven) {
    auto const structure = MetaStruct::New("S");
    structure->SetField("literal zero", 0);
    structure->SetField("true", true);
    structure->SetField("text", "chars");
    structure->SetField("string", std::string("string"));
    structure->SetField("number", int64_t{1} << 40);
    structure->SetField("null", static_cast<char const *>(nullptr));
    structure->SetField("texts", std::vector<std::string>{"a", "b"});
    EXPECT_NE(boost::dynamic_pointer_cast<MetaInt>(structure->GetField("literal zero")), nullptr);
    EXPECT_TRUE(boost::dynamic_pointer_cast<MetaBool>(structure->GetField("true"))->GetValue());
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaString>(structure->GetField("text"))->GetValue(), "chars");
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaString>(structure->GetField("string"))->GetValue(), "string");
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaInt>(structure->GetField("number"))->GetValue(), 1099511627776);
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaString>(structure->GetField("null"))->GetValue(), "");
    auto const list = boost::dynamic_pointer_cast<MetaList>(structure->GetField("texts"));
    ASSERT_NE(list, nullptr);
    EXPECT_EQ(list->GetType(), StringList);
    ASSERT_EQ(list->GetElements().size(), 2U);
    EXPECT_EQ(boost::dynamic_pointer_cast<MetaString>(list->GetElements()[1])->GetValue(), "b");
}

TEST(Values, AFieldSetAgainKeepsItsPlace) {
    auto const structure = MetaStruct::New("S");
    structure->SetField("first", MetaString::New());
    structure->SetField("second", MetaInt::New());
    structure->SetField("first", "value");
    EXPECT_EQ(structure->GetFieldNames(), (std::vector<std::string>{"first", "second"}));
    EXPECT_TRUE(structure->GetField("first")->IsSet());
    EXPECT_EQ(structure->GetField("third"), nullptr);
    EXPECT_EQ(structure->GetName(), "S");
}

TEST(Values, ListRemembersItsElementSchema) {
    auto const schema = MetaStruct::New("S");
    EXPECT_EQ(MetaList::New(StructList, schema)->GetElementSchema(), schema);
    EXPECT_EQ(MetaList::New(StructList)->GetElementSchema(), nullptr);
}

TEST(Values, InputReadsAbsentAndOtherKindsAsEmpty) {
    auto const input = Input::New();
    input->SetString("text", "7");
    EXPECT_TRUE(input->HasParameter("text"));
    EXPECT_EQ(input->GetInt("text"), 0);
    EXPECT_FALSE(input->GetBool("text"));
    EXPECT_TRUE(input->GetStringList("text").empty());
    EXPECT_FALSE(input->HasParameter("absent"));
    EXPECT_EQ(input->GetString("absent"), "");
    EXPECT_TRUE(input->GetIntList("absent").empty());
    EXPECT_TRUE(input->GetBoolList("absent").empty());
    input->SetString("empty", "");
    EXPECT_TRUE(input->HasParameter("empty"));
}

TEST(Values, FlagIsPresentAndTrue) {
    auto const input = Input::New();
    EXPECT_FALSE(input->HasParameter("flag"));
    EXPECT_FALSE(input->GetBool("flag"));
    input->SetFlag("flag");
    EXPECT_TRUE(input->HasParameter("flag"));
    EXPECT_TRUE(input->GetBool("flag"));
}

TEST(Values, OutputKeepsWhatACallLeaves) {
    auto const output = Output::New();
    EXPECT_FALSE(output->HasMessage());
    EXPECT_FALSE(output->IsComplete());
    EXPECT_EQ(output->GetResult(), nullptr);
    output->SetMessage("");
    EXPECT_TRUE(output->HasMessage());
    output->SetMessage("text\n");
    EXPECT_EQ(output->GetMessage(), "text\n");
    output->SetResult(MetaBool::New(true));
    output->Complete();
    EXPECT_TRUE(output->IsComplete());
    EXPECT_NE(output->GetResult(), nullptr);
}

TEST(Values, ParameterKeepsItsDeclaration) {
    auto const parameter = ParameterSpec::New("size", Plexa::CallSpec::Int);
    EXPECT_EQ(parameter->GetAlias(), "");
    EXPECT_FALSE(parameter->IsRequired());
    parameter->SetAlias("s");
    parameter->SetDescription("Size in MB");
    parameter->SetRequired(true);
    EXPECT_EQ(parameter->GetName(), "size");
    EXPECT_EQ(parameter->GetType(), Plexa::CallSpec::Int);
    EXPECT_EQ(parameter->GetAlias(), "s");
    EXPECT_EQ(parameter->GetDescription(), "Size in MB");
    EXPECT_TRUE(parameter->IsRequired());
}

} // namespace
