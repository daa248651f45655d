// SPDX-License-Identifier: Apache-2.0
//
// Holds the published description against the one declaration of messages: what each schema lists, and of what kind,
// is what client and server read and write.
#include <array>
#include <set>
#include <string>
#include <utility>

#include <gtest/gtest.h>

#include "../Fixture.h"
#include "JsonReading.h"
#include "https/Messages.h"
#include "https/Protocol.h"
#include "https/ServiceOperations.h"

namespace {

using namespace Orka;
using namespace Orka::Https;

/// Writes down what fields() declares: member, kind, and whether it must be there.
class Declared {
public:
    template <typename T>
    static std::string of() {
        Declared declared;
        T object;
        fields(declared, object);
        return declared.text_;
    }
    template <typename T>
    void text(char const *member, T &) {
        add(member, "string", isOptional<T>);
    }
    void name(char const *member, std::string &) {
        add(member, "string", false);
    }
    void uuid(char const *member, std::string &) {
        add(member, "string:uuid", false);
    }
    template <typename T>
    void number(char const *member, T &) {
        add(member, sizeof(T) == sizeof(int32_t) ? "integer:int32" : "integer:int64", false);
    }
    template <typename T>
    void amount(char const *member, T &) {
        add(member, "integer:int64", isOptional<T>);
    }
    void flag(char const *member, bool &) {
        add(member, "boolean", false);
    }
    void kind(char const *member, VolumeKind &) {
        add(member, "string", false);
    }
    void bytes(char const *member, std::vector<uint8_t> &) {
        add(member, "string:byte", false);
    }
    void texts(char const *member, std::vector<std::string> &) {
        add(member, "array", false);
    }
    template <typename T>
    void list(char const *member, T &) {
        add(member, "array", false);
    }
    template <typename T>
    void structure(char const *member, T &) {
        add(member, "ref", isOptional<T>);
    }

private:
    template <typename T>
    static constexpr bool isOptional = requires(T value) {
        value.has_value();
    };
    void add(std::string const &member, std::string const &kind, bool optional) {
        text_ += member + ' ' + kind + (optional ? "?\n" : "\n");
    }
    std::string text_;
};

std::string published(rapidjson::Value const &schema) {
    std::string text;
    std::set<std::string> required;
    if (schema.HasMember("required")) {
        for (auto const &name : schema["required"].GetArray()) {
            required.insert(name.GetString());
        }
    }
    if (!schema.HasMember("properties")) {
        return text;
    }
    for (auto const &member : schema["properties"].GetObject()) {
        std::string kind = "ref";
        if (member.value.HasMember("type")) {
            kind = member.value["type"].GetString();
            if (member.value.HasMember("format")) {
                kind += std::string(":") + member.value["format"].GetString();
            }
        }
        text += std::string(member.name.GetString()) + ' ' + kind +
                (required.count(member.name.GetString()) ? "\n" : "?\n");
    }
    return text;
}

class OpenApiTest : public ::testing::Test {
protected:
    OpenApiTest() {
        parseJson(bytesOf(TOVI_DOCS "/provider-protocol.openapi.json"), "openapi", document_);
    }
    rapidjson::Value const &schema(char const *name) {
        return document_["components"]["schemas"][name];
    }
    rapidjson::Document document_;
};

TEST_F(OpenApiTest, describesEveryMessageAsItIsReadAndWritten) {
    std::vector<std::pair<char const *, std::string>> const declared{
        {"Envelope", Declared::of<Envelope>()},
        {"ListRequest", Declared::of<ListRequest>()},
        {"BoundVolumesRequest", Declared::of<BoundVolumesRequest>()},
        {"VolumesOfContainerRequest", Declared::of<VolumesOfContainerRequest>()},
        {"CreateRequest", Declared::of<CreateRequest>()},
        {"VolumeRequest", Declared::of<VolumeRequest>()},
        {"BindRequest", Declared::of<BindRequest>()},
        {"VolumesByIdRequest", Declared::of<VolumesByIdRequest>()},
        {"VolumeByDirectoryNameRequest", Declared::of<VolumeByDirectoryNameRequest>()},
        {"ContextRequest", Declared::of<ContextRequest>()},
        {"Endpoint", Declared::of<Endpoint>()},
        {"StorageArray", Declared::of<StorageArray>()},
        {"StorageContainer", Declared::of<StorageContainer>()},
        {"VirtualVolume", Declared::of<VirtualVolume>()},
        {"ConfigVolume", Declared::of<ConfigVolume>()},
        {"VolumePresence", Declared::of<VolumePresence>()},
        {"MetadataPair", Declared::of<MetadataPair>()},
        {"SpaceStats", Declared::of<SpaceStats>()},
        {"UnsharedChunks", Declared::of<UnsharedChunks>()},
        {"StorageArrayList", Declared::of<ListAnswer<StorageArray>>()},
        {"StorageContainerList", Declared::of<ListAnswer<StorageContainer>>()},
        {"ConfigVolumePage", Declared::of<PageAnswer<ConfigVolume>>()},
        {"VirtualVolumePage", Declared::of<PageAnswer<VirtualVolume>>()},
        {"VolumePresences", Declared::of<ItemsAnswer<VolumePresence>>()},
        {"Metadata", Declared::of<ItemsAnswer<MetadataPair>>()},
        {"MaybeVolume", Declared::of<MaybeVolumeAnswer>()},
        {"Done", Declared::of<DoneAnswer>()},
        {"ErrorBody", Declared::of<ErrorBody>()},
        {"Error", Declared::of<ErrorAnswer>()},
    };
    for (auto const &[name, fieldsOfIt] : declared) {
        ASSERT_TRUE(document_["components"]["schemas"].HasMember(name)) << name;
        EXPECT_EQ(published(schema(name)), fieldsOfIt) << name;
    }
    EXPECT_EQ(document_["components"]["schemas"].MemberCount(), declared.size());
}

TEST_F(OpenApiTest, thePageForImplementersNamesEveryMemberAndOperation) {
    auto const page = bytesOf(TOVI_DOCS "/provider-protocol.md");
    auto const isNamed = [&](std::string const &name) {
        return page.find('`' + name + '`') != std::string::npos || page.find('`' + name + "?`") != std::string::npos;
    };
    rapidjson::Value const &schemas = document_["components"]["schemas"];
    for (auto const &one : schemas.GetObject()) {
        if (one.value.HasMember("properties")) {
            for (auto const &member : one.value["properties"].GetObject()) {
                EXPECT_TRUE(isNamed(member.name.GetString())) << one.name.GetString() << '.' << member.name.GetString();
            }
        }
    }
    rapidjson::Value const &paths = document_["paths"];
    for (auto const &path : paths.GetObject()) {
        EXPECT_TRUE(isNamed(std::string(path.name.GetString()).substr(4))) << path.name.GetString();
    }
}

TEST_F(OpenApiTest, describesEveryOperationThatIsServedAndNoOther) {
    int count = 0;
    rapidjson::Value const &paths = document_["paths"];
    for (auto const &path : paths.GetObject()) {
        std::string const name(path.name.GetString());
        ASSERT_EQ(name.rfind("/v1/", 0), 0U) << name;
        EXPECT_NE(ServiceOperations::named(name.substr(4)), nullptr) << name;
        ++count;
    }
    EXPECT_EQ(count, 15);
}

TEST_F(OpenApiTest, listsEveryErrorThatAnAnswerMayName) {
    std::set<std::string> listed;
    for (auto const &name : schema("ErrorBody")["properties"]["code"]["x-known"].GetArray()) {
        listed.insert(name.GetString());
        std::string const text(name.GetString());
        EXPECT_TRUE(errorNamed(text) != nullptr || text == stalePage || text == unknownVersion) << text;
    }
    for (auto const code :
         {Wire::ErrorCode::IoError, Wire::ErrorCode::InvalidArgument, Wire::ErrorCode::NoSuchContainer,
          Wire::ErrorCode::NoSuchVolume, Wire::ErrorCode::NoSuchEndpoint, Wire::ErrorCode::AlreadyExists,
          Wire::ErrorCode::InUse, Wire::ErrorCode::TooLarge, Wire::ErrorCode::NoAccessibleEndpoint,
          Wire::ErrorCode::ProviderBusy, Wire::ErrorCode::DeadlineExceeded, Wire::ErrorCode::NotPermitted,
          Wire::ErrorCode::UnknownOperation}) {
        EXPECT_EQ(listed.count(std::string(nameOf(code).name)), 1U) << nameOf(code).name;
    }
}

} // namespace
