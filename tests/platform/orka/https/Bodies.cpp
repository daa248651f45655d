// SPDX-License-Identifier: Apache-2.0
//
// Documents as they are written; reading them is tested by what lying providers answer.
#include "https/BodyWriter.h"

#include <string>
#include <utility>

#include <gtest/gtest.h>

#include "https/Messages.h"
#include "wire/Failure.h"

namespace {

using Orka::Https::bodyOf;

TEST(Body, isNotMadeOfTextsThatAreNoUtf8) {
    // The bad text comes first and last: what follows does not make it good.
    for (Orka::Https::VolumeRequest const &request :
         {Orka::Https::VolumeRequest{"c\xff", "u"}, Orka::Https::VolumeRequest{"c", "\xed\xa0\x80"}}) {
        try {
            ADD_FAILURE() << bodyOf(request);
        } catch (Wire::Failure const &failure) {
            EXPECT_EQ(failure.code(), Wire::ErrorCode::InvalidArgument);
            EXPECT_EQ(failure.sentence(), "a text that is not UTF-8 cannot be sent as JSON");
        }
    }
    EXPECT_EQ(bodyOf(Orka::Https::VolumeRequest{"c", "\xc3\xa9"}), "{\"containerId\":\"c\",\"uuid\":\"\xc3\xa9\"}");
}

TEST(Body, leavesAKindThatThereIsNotToBeRefusedByTheProvider) {
    Orka::Https::CreateRequest request;
    for (auto const &[kind, word] :
         {std::pair{0, "config"}, std::pair{1, "data"}, std::pair{7, "kind 7"}, std::pair{-1, "kind -1"}}) {
        request.spec.kind = static_cast<Orka::VolumeKind>(kind);
        EXPECT_EQ(bodyOf(request), std::string("{\"containerId\":\"\",\"kind\":\"") + word +
                                       "\",\"directoryName\":\"\",\"sizeMb\":0,\"vmUuid\":\"\"}");
    }
}

TEST(Slice, endsByCountBySizeOrWithItsList) {
    std::vector<Orka::ConfigVolume> const volumes(5, Orka::ConfigVolume{"u", "d", std::nullopt});
    auto const slice = [&volumes](std::size_t offset, std::size_t most, std::size_t bytesMost) {
        Orka::Https::BodyWriter writer;
        writer.begin();
        std::size_t const count = writer.slice("items", volumes, offset, most, bytesMost);
        writer.end();
        EXPECT_EQ(writer.take().find("\"items\":["), 1U);
        return count;
    };
    EXPECT_EQ(slice(0, 10, 1000), 5U);
    EXPECT_EQ(slice(3, 10, 1000), 2U);
    EXPECT_EQ(slice(5, 10, 1000), 0U);
    EXPECT_EQ(slice(0, 2, 1000), 2U);
    EXPECT_EQ(slice(0, 10, 1), 1U) << "one, however long";
    EXPECT_EQ(slice(0, 10, 60), 2U);
}

} // namespace
