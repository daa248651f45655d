// SPDX-License-Identifier: Apache-2.0
//
// Structures in a list lie close together. Nobody who holds one may notice, whatever is done with it afterwards.
#include <gtest/gtest.h>

#include "plexa/MetaObj.h"

namespace {

using namespace Plexa::MetaObj;

boost::shared_ptr<MetaStruct> row(std::string const &key, std::string const &value, int64_t number = 7) {
    auto const made = MetaStruct::New("Row");
    made->SetField("key", key);
    made->SetField("value", value.c_str());
    made->SetField("number", number);
    made->SetField("truth", true);
    return made;
}

template <typename Value>
auto valueOf(MetaStruct const &structure, std::string const &field) {
    auto const value = boost::dynamic_pointer_cast<Value>(structure.GetField(field));
    EXPECT_NE(value, nullptr) << field;
    return value->GetValue();
}

void expectRow(MetaStruct const &structure, std::string const &key, std::string const &value, int64_t number = 7) {
    EXPECT_EQ(structure.GetName(), "Row");
    EXPECT_EQ(structure.GetFieldNames(), (std::vector<std::string>{"key", "value", "number", "truth"}));
    EXPECT_EQ(valueOf<MetaString>(structure, "key"), key);
    EXPECT_EQ(valueOf<MetaString>(structure, "value"), value);
    EXPECT_EQ(valueOf<MetaInt>(structure, "number"), number);
    EXPECT_TRUE(valueOf<MetaBool>(structure, "truth"));
}

MetaStruct const &structureIn(MetaList const &list, std::size_t place) {
    return static_cast<MetaStruct const &>(*list.ViewElements().at(place));
}

/// What a format reads, which asks for no objects.
std::string viewed(MetaStruct const &structure, std::size_t place) {
    return std::string(dynamic_cast<MetaString const &>(*structure.ViewFields().value(place)).ViewValue());
}

TEST(Rows, ManyAreReadBackAsTheyWereAppended) {
    constexpr int64_t count = 30000; // far beyond what is allocated for short lists
    auto const list = MetaList::New(StructList);
    for (int64_t i = 0; i < count; ++i) {
        list->Append(row("key " + std::to_string(i), std::string(static_cast<std::size_t>(i % 50), 'v'), i));
    }
    ASSERT_EQ(list->GetElements().size(), static_cast<std::size_t>(count));
    for (int64_t i = 0; i < count; ++i) {
        MetaStruct const &structure = structureIn(*list, static_cast<std::size_t>(i));
        ASSERT_EQ(viewed(structure, 0), "key " + std::to_string(i));
        ASSERT_EQ(viewed(structure, 1).size(), static_cast<std::size_t>(i % 50));
        ASSERT_EQ(dynamic_cast<MetaInt const &>(*structure.ViewFields().value(2)).GetValue(), i);
    }
    expectRow(structureIn(*list, 29999), "key 29999", std::string(49, 'v'), 29999);
}

TEST(Rows, OneThatIsHeldOutlivesItsList) {
    boost::shared_ptr<MetaStruct> held;
    {
        auto const list = MetaList::New(StructList);
        for (int i = 0; i < 1000; ++i) {
            auto const made = row(std::to_string(i), "value");
            list->Append(made);
            held = i == 500 ? made : held;
        }
        EXPECT_EQ(list->GetElements()[500], held);
    }
    EXPECT_EQ(viewed(*held, 0), "500");
    expectRow(*held, "500", "value");
}

TEST(Rows, OneThatIsSetAgainChangesAlone) {
    auto const list = MetaList::New(StructList);
    auto const first = row("first", "a");
    auto const second = row("second", "b");
    list->Append(first);
    list->Append(second);
    first->SetField("value", "a text that is longer than the one before");
    second->SetField("more", "b2");
    EXPECT_EQ(viewed(structureIn(*list, 0), 1), "a text that is longer than the one before");
    EXPECT_EQ(structureIn(*list, 1).GetFieldNames().back(), "more");
    list->Append(first); // the same once more
    expectRow(structureIn(*list, 2), "first", "a text that is longer than the one before");
    EXPECT_EQ(viewed(structureIn(*list, 1), 1), "b");
}

TEST(Rows, AValueThatWasAskedForStaysTheSame) {
    auto const list = MetaList::New(StructList);
    auto const before = row("key", "value");
    MetaObject const *const asked = before->GetField("key").get();
    list->Append(before);
    EXPECT_EQ(before->GetField("key").get(), asked);
    auto const after = row("key", "value");
    list->Append(after);
    MetaObject const *const number = after->GetField("number").get();
    EXPECT_EQ(after->GetField("number").get(), number);
    expectRow(*after, "key", "value");
    auto const given = MetaString::New("given");
    after->SetField("key", given);
    list->Append(after);
    EXPECT_EQ(after->GetField("key"), given);
}

TEST(Rows, OnesThatAreUnlikeStandBesideEachOther) {
    auto const list = MetaList::New(StructList);
    auto const odd = MetaStruct::New("Odd");
    odd->SetField("a", MetaString::New());
    odd->SetField("b", MetaList::New(StringList));
    list->Append(odd);
    list->Append(MetaStruct::New("Empty"));
    for (int i = 0; i < 10; ++i) {
        list->Append(row(std::to_string(i), "v"));
        auto const other = row(std::to_string(i), "v");
        other->SetField("number", "a text where a number was");
        list->Append(other);
    }
    EXPECT_FALSE(structureIn(*list, 0).GetField("a")->IsSet());
    EXPECT_TRUE(structureIn(*list, 1).GetFieldNames().empty());
    EXPECT_EQ(structureIn(*list, 1).GetName(), "Empty");
    for (std::size_t i = 0; i < 10; ++i) {
        expectRow(structureIn(*list, 2 + 2 * i), std::to_string(i), "v");
        EXPECT_EQ(viewed(structureIn(*list, 3 + 2 * i), 2), "a text where a number was");
    }
}

TEST(Rows, ListsInsideAreLetGoOfWithTheirRow) {
    auto const inner = MetaList::New(StringList);
    {
        auto const list = MetaList::New(StructList);
        for (int i = 0; i < 3; ++i) {
            auto const made = MetaStruct::New("Outer");
            made->SetField("name", "n");
            made->SetField("inner", inner);
            list->Append(made);
        }
        EXPECT_EQ(inner.use_count(), 4);
        EXPECT_EQ(structureIn(*list, 2).GetField("inner"), inner);
    }
    EXPECT_EQ(inner.use_count(), 1);
}

TEST(Rows, TextsOfAnySizeAndContent) {
    auto const list = MetaList::New(StructList);
    std::string const large(100000, 'x');
    std::string const withNul("a\0b", 3);
    auto const schema = row("", "");
    schema->SetField("key", MetaString::New()); // declared, then set by value
    for (std::string const &text : {large, withNul, std::string()}) {
        auto const made = boost::shared_ptr<MetaStruct>(new MetaStruct(*schema));
        made->SetField("key", text);
        list->Append(made);
        expectRow(*made, text, "");
    }
    EXPECT_FALSE(schema->GetField("key")->IsSet());
}

TEST(Rows, ACopyIsOnItsOwn) {
    auto const list = MetaList::New(StructList);
    auto const original = row("key", "value");
    list->Append(original);
    MetaStruct copy(*original);
    copy.SetField("key", "other");
    expectRow(copy, "other", "value");
    expectRow(*original, "key", "value");
    MetaString text(*MetaString::New("text"));
    MetaString const unset;
    EXPECT_EQ(text.GetValue(), "text");
    text = unset;
    EXPECT_FALSE(text.IsSet());
    EXPECT_EQ(MetaStruct().GetName(), "");
    EXPECT_EQ(MetaStruct().GetField("none"), nullptr);
}

} // namespace
