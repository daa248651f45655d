// SPDX-License-Identifier: Apache-2.0
//
// Protocol endpoints as lines of text, and arrays as structures.
#include "StorageContainerLoad.h"

#include <boost/pointer_cast.hpp>

#include "CommandTest.h"

using namespace PluginTest;
using Doubles::ContainerReply;
using Doubles::Endpoint;
using Doubles::StorageArray;
using Doubles::Transport;
using TarselCli::LumoNamespace::SAInfo;
using TarselCli::LumoNamespace::StorageContainerLoad;
using namespace Plexa::MetaObj;

namespace {

class EndpointLines : public CommandTest {
protected:
    /// Loads one container of which one array has these endpoints; the lines that come out of it, rendered.
    std::string linesOf(std::vector<Endpoint> const &endpoints) {
        StorageArray const array = {Text("a"), Text("n"), Text("v"), Text("m"), endpoints};
        load({array});
        return Doubles::render(arrayOf(0)->GetField("PEInfo"));
    }
    std::string lineOf(Endpoint const &endpoint) {
        return linesOf({endpoint});
    }
    void load(std::vector<StorageArray> const &arrays) {
        renewCall();
        lumo.getStorageContainer.once(
            ContainerReply{0, "", lumo.records.containers({{Text("c"), Text("c"), Text("u"), 1, arrays}})});
        kestrel.addLumoFileSystem.once(FileSystemScript("c"));
        run<StorageContainerLoad>();
    }
    boost::shared_ptr<MetaStruct> arrayOf(std::size_t index) const {
        auto const rows = boost::dynamic_pointer_cast<MetaList>(output->GetResult())->GetElements();
        auto const row = boost::dynamic_pointer_cast<MetaStruct>(rows.at(0));
        auto const arrays = boost::dynamic_pointer_cast<MetaList>(row->GetField("Arrays"));
        return boost::dynamic_pointer_cast<MetaStruct>(arrays->GetElements().at(index));
    }
};

Transport const nfs = {EndpointTransportNfs, Text("10.0.0.5"), Text("/exports/pe1")};

TEST_F(EndpointLines, AnNfsEndpointShowsAddressAndMount) {
    EXPECT_EQ(lineOf({Text("3e7f01"), true, false, nfs, {}}),
              "[\"PE #0 (localUID: 3e7f01, isAccessible: 1, isConfigured: 0, type: NFS, ipAddress: 10.0.0.5, "
              "serverMount: /exports/pe1)\"]");
}

TEST_F(EndpointLines, AScsiEndpointShowsItsLunAndNotTheSecondText) {
    EXPECT_EQ(lineOf({Text("u"), false, true, Transport{EndpointTransportScsi, Text("naa.1"), Text("unread")}, {}}),
              "[\"PE #0 (localUID: u, isAccessible: 0, isConfigured: 1, type: SCSI, lunID: naa.1)\"]");
}

TEST_F(EndpointLines, AnNfs4xEndpointJoinsItsAddressesWithoutBlanks) {
    Transport const nfs4x = {EndpointTransportNfs4x, Text("/m"), Text("unread")};
    EXPECT_EQ(lineOf({Text("u"), true, true, nfs4x, {Text("10.0.0.1"), Text("10.0.0.2"), Text("fe80::1")}}),
              "[\"PE #0 (localUID: u, isAccessible: 1, isConfigured: 1, type: NFS4x, ipAddress(es): "
              "10.0.0.1,10.0.0.2,fe80::1, serverMount: /m)\"]");
    EXPECT_THAT(callsOf("VectorToString"),
                ElementsAre("VectorToString([\"10.0.0.1\", \"10.0.0.2\", \"fe80::1\"], \",\")"));
}

TEST_F(EndpointLines, AnNfs4xEndpointWithoutAddressesGoesOnWithTheMount) {
    EXPECT_EQ(lineOf({Text("u"), true, true, Transport{EndpointTransportNfs4x, Text("/m"), Text()}, {}}),
              "[\"PE #0 (localUID: u, isAccessible: 1, isConfigured: 1, type: NFS4x, ipAddress(es): , serverMount: "
              "/m)\"]");
}

TEST_F(EndpointLines, AnyOtherTransportEndsTheLineOpen) {
    for (int32_t const type : {3, 4, -1, INT32_MAX, INT32_MIN}) {
        EXPECT_EQ(lineOf({Text("u"), true, true, Transport{type, Text("1"), Text("2")}, {Text("3")}}),
                  "[\"PE #0 (localUID: u, isAccessible: 1, isConfigured: 1\"]")
            << type;
    }
}

TEST_F(EndpointLines, AMissingTransportEndsTheLineOpen) {
    EXPECT_EQ(lineOf({Text("u"), true, false, std::nullopt, {}}),
              "[\"PE #0 (localUID: u, isAccessible: 1, isConfigured: 0\"]");
}

TEST_F(EndpointLines, AMissingTextEndsTheLineAtItsLabel) {
    std::string const head = "[\"PE #0 (localUID: u, isAccessible: 1, isConfigured: 1, type: ";
    auto const with = [](Transport const &transport) { return Endpoint{Text("u"), true, true, transport, {}}; };
    EXPECT_EQ(lineOf({Text(), true, true, nfs, {}}), "[\"PE #0 (localUID: \"]");
    EXPECT_EQ(lineOf(with({EndpointTransportScsi, Text(), Text()})), head + "SCSI, lunID: \"]");
    EXPECT_EQ(lineOf(with({EndpointTransportNfs, Text(), Text("/m")})), head + "NFS, ipAddress: \"]");
    EXPECT_EQ(lineOf(with({EndpointTransportNfs, Text("ip"), Text()})), head + "NFS, ipAddress: ip, serverMount: \"]");
    EXPECT_EQ(lineOf(with({EndpointTransportNfs4x, Text(), Text("/m")})),
              head + "NFS4x, ipAddress(es): , serverMount: \"]");
}

TEST_F(EndpointLines, AnEmptyTextIsNotAMissingOne) {
    EXPECT_EQ(lineOf({Text(""), true, true, Transport{EndpointTransportScsi, Text(""), Text()}, {}}),
              "[\"PE #0 (localUID: , isAccessible: 1, isConfigured: 1, type: SCSI, lunID: )\"]");
}

TEST_F(EndpointLines, AnArrayWithoutEndpointsHasAnEmptyList) {
    EXPECT_EQ(linesOf({}), "[]");
}

TEST_F(EndpointLines, NumbersRestartInEachArray) {
    Endpoint const endpoint = {Text("u"), true, true, std::nullopt, {}};
    std::string const rest = " (localUID: u, isAccessible: 1, isConfigured: 1\"";
    load({{Text("a"), Text(), Text(), Text(), {endpoint, endpoint}}, {Text("b"), Text(), Text(), Text(), {endpoint}}});
    EXPECT_EQ(Doubles::render(arrayOf(0)->GetField("PEInfo")), "[\"PE #0" + rest + ", \"PE #1" + rest + "]");
    EXPECT_EQ(Doubles::render(arrayOf(1)->GetField("PEInfo")), "[\"PE #0" + rest + "]");
    EXPECT_THAT(callsOf("StorageInfoImpl.Add"),
                ElementsAre("StorageInfoImpl.AddLumoFileSystem(\"c\", \"c\", [\"a\", \"b\"], true)"));
}

class ArrayStructures : public CommandTest {};

TEST_F(ArrayStructures, HoldOneStructureForEachArray) {
    std::vector<SAInfo> arrays = {{"1", "n", "v", "m", {"x", "y"}}, {"2", "", "", "", {}}};
    auto const list = StorageContainerLoad::New()->GetStorageArrayList(arrays);
    EXPECT_EQ(Doubles::render(list),
              "[Array{ArrayId: \"1\", Name: \"n\", VendorId: \"v\", ModelId: \"m\", PEInfo: [\"x\", \"y\"]}, "
              "Array{ArrayId: \"2\", Name: \"\", VendorId: \"\", ModelId: \"\", PEInfo: []}]");
    EXPECT_EQ(Doubles::describe(list->GetElementSchema()),
              "Array{ArrayId: string, Name: string, VendorId: string, ModelId: string, PEInfo: list of strings}");
}

TEST_F(ArrayStructures, AreEmptyWithoutArrays) {
    std::vector<SAInfo> none;
    auto const list = StorageContainerLoad::New()->GetStorageArrayList(none);
    EXPECT_EQ(list->GetType(), StructList);
    EXPECT_THAT(list->GetElements(), IsEmpty());
}

TEST_F(ArrayStructures, AreFreshEachTime) {
    auto const command = StorageContainerLoad::New();
    EXPECT_NE(command->GetOutputStructure(), command->GetOutputStructure());
    auto const filled = command->GetStorageArrayStructure();
    filled->SetField("Name", "filled");
    EXPECT_FALSE(command->GetStorageArrayStructure()->GetField("Name")->IsSet());
}

} // namespace
