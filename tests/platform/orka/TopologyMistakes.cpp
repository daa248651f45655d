// SPDX-License-Identifier: Apache-2.0
//
// A table of mistakes and of what is said about each.
#include "Fixture.h"

#include <ostream>

#include "wire/Failure.h"

namespace {

struct Mistake {
    char const *name;
    std::string json;
    std::string sentence;
};

/// Without it, a test's name would hold the bytes of the structure, addresses among them.
std::ostream &operator<<(std::ostream &stream, Mistake const &mistake) {
    return stream << mistake.name;
}

std::string withEndpoint(std::string const &endpoint) {
    return R"({"arrays": [{"id": "a", "endpoints": [)" + endpoint + "]}]}";
}

/// Two arrays with an endpoint each, and one container on the first that has this and that besides its id.
std::string withContainer(std::string const &rest) {
    return R"({"arrays": [{"id": "a", "endpoints": [{"uid": "pe-a", "type": "SCSI"}]},
                          {"id": "b", "endpoints": [{"uid": "pe-b", "type": "SCSI"}]}],
               "containers": [{"id": "00000000-0000-4000-8000-000000000001")" +
           rest + "}]}";
}

std::string withVolumes(std::string const &volumes) {
    return withContainer(R"(, "name": "c", "maxLumoSizeMb": 100, "arrays": ["a"], "volumes": [)" + volumes + "]");
}

/// A config volume that has this and that besides its id and name.
std::string withVolume(std::string const &rest) {
    return withVolumes(R"({"uuid": "00000000-0000-4000-8000-000000000002", "directoryName": "d")" + rest + "}");
}

std::vector<Mistake> const mistakes{
    // The JSON itself.
    {"Empty", "", "t.json: line 1, column 1: The document is empty."},
    {"NoValue", "{\n  \"arrays\": ]\n}", "t.json: line 2, column 13: Invalid value."},
    {"NoComma", "{\"arrays\": []\n\"containers\": []}",
     "t.json: line 2, column 1: Missing a comma or '}' after an object member."},
    {"CutOff", "{\"arrays\": [", "t.json: line 1, column 13: Invalid value."},
    {"TwoDocuments", "{\"arrays\": []}\n{}",
     "t.json: line 2, column 1: The document root must not be followed by other values."},
    {"SomethingBehindANul", std::string("{\"arrays\": []}\0{}", 17),
     "t.json: line 1, column 15: The document root must not be followed by other values."},
    {"NoUtf8", "{\"arrays\": \"\xff\"}", "t.json: line 1, column 13: Invalid encoding in string."},
    {"HalfOfASurrogatePair", R"({"arrays": ["\ud83d\ude00\ude00"]})",
     "t.json: line 1, column 26: The surrogate pair in string is invalid."},
    {"SurrogatePair", R"({"arrays": "\ud83d\ude00"})",
     "t.json: arrays: a list is expected, not the text \"\xF0\x9F\x98\x80\""},
    {"NoSurrogateBehindABackslash", R"({"arrays": "\\ude00"})",
     "t.json: arrays: a list is expected, not the text \"\\\\ude00\""},
    {"NoSurrogateAboveThePairs", R"({"arrays": "\ue000\uffff"})",
     "t.json: arrays: a list is expected, not the text \"\xEE\x80\x80\xEF\xBF\xBF\""},
    {"DeeplyNested", std::string(1000000, '['), "t.json: line 1, column 1000001: Invalid value."},

    // The document.
    {"NoObject", "[]", "t.json: the document: an object is expected, not a list"},
    {"NoArrays", "{}", "t.json: the document: the member \"arrays\" is missing"},
    {"ArraysNull", R"({"arrays": null})", "t.json: the document: the member \"arrays\" is missing"},
    {"ArraysNoList", R"({"arrays": {}})", "t.json: arrays: a list is expected, not an object"},
    {"ContainersNoList", R"({"arrays": [], "containers": "x"})",
     "t.json: containers: a list is expected, not the text \"x\""},
    {"StrangeText", R"({"arrays": "\u00e9\u007f\\\"\u0001"})",
     "t.json: arrays: a list is expected, not the text \"\u00e9\\u007f\\\\\\\"\\u0001\""},
    {"LongText", R"({"arrays": ")" + std::string(81, 'x') + R"("})",
     "t.json: arrays: a list is expected, not the text \"" + std::string(80, 'x') + "...\""},
    {"DescriptionNoText", R"({"arrays": [], "description": 1})", "t.json: description: a text is expected, not 1"},
    {"UnknownMember", R"({"arrays": [], "array": []})",
     "t.json: the document: there is no member \"array\" here; known are: description, arrays, containers"},
    {"MemberTwice", R"({"arrays": [], "arrays": []})", "t.json: the document: the member \"arrays\" stands here twice"},
    {"StrangeMember", R"({"arrays": [], "a\n\"b": []})",
     "t.json: the document: there is no member \"a\\u000a\\\"b\" here; known are: description, arrays, containers"},

    // Arrays.
    {"ArrayNoObject", R"({"arrays": [true]})", "t.json: arrays[0]: an object is expected, not true"},
    {"ArrayWithoutId", R"({"arrays": [{}]})", "t.json: arrays[0]: the member \"id\" is missing"},
    {"ArrayIdEmpty", R"({"arrays": [{"id": ""}]})", "t.json: arrays[0].id: an empty text is not allowed here"},
    {"ArrayIdNoText", R"({"arrays": [{"id": 1.5}]})", "t.json: arrays[0].id: a text is expected, not the number 1.5"},
    {"ArrayIdZeroWithAnExponent", R"({"arrays": [{"id": 0e300}]})",
     "t.json: arrays[0].id: a text is expected, not the number 0"},
    {"ArrayIdWithNul", R"({"arrays": [{"id": "a\u0000"}]})",
     "t.json: arrays[0].id: a text cannot hold the character NUL"},
    {"ArrayIdTwice", R"({"arrays": [{"id": "a"}, {"id": "a"}]})",
     "t.json: arrays[1].id: another storage array has the id \"a\""},
    {"ArrayUnknownMember", R"({"arrays": [{"id": "a", "vendor": "v"}]})",
     "t.json: arrays[0]: there is no member \"vendor\" here; known are: id, name, vendorId, modelId, endpoints"},
    {"ArrayNameNoText", R"({"arrays": [{"id": "a", "name": []}]})",
     "t.json: arrays[0].name: a text is expected, not a list"},

    // Endpoints.
    {"EndpointWithoutType", withEndpoint("{}"), "t.json: arrays[0].endpoints[0]: the member \"type\" is missing"},
    {"EndpointTypeUnknown", withEndpoint(R"({"type": "scsi"})"),
     "t.json: arrays[0].endpoints[0].type: SCSI, NFS, NFS4x or another transport's number is expected, not \"scsi\""},
    {"EndpointTypeNumberWithAWord", withEndpoint(R"({"type": 1})"),
     "t.json: arrays[0].endpoints[0].type: the transports 0, 1 and 2 have words: SCSI, NFS, NFS4x"},
    {"EndpointTypeTooLarge", withEndpoint(R"({"type": 2147483648})"),
     "t.json: arrays[0].endpoints[0].type: a whole number from -2147483648 to 2147483647 is expected, not 2147483648"},
    {"EndpointTypeBool", withEndpoint(R"({"type": true})"),
     "t.json: arrays[0].endpoints[0].type: a text is expected, not true"},
    {"EndpointUidEmpty", withEndpoint(R"({"uid": "", "type": "SCSI"})"),
     "t.json: arrays[0].endpoints[0].uid: an empty text is not allowed here"},
    {"EndpointUidTwice", withEndpoint(R"({"uid": "p", "type": "SCSI"}, {"uid": "p", "type": "NFS"})"),
     "t.json: arrays[0].endpoints[1].uid: another protocol endpoint has the uid \"p\""},
    {"EndpointUidTwiceAcrossArrays",
     R"({"arrays": [{"id": "a", "endpoints": [{"uid": "p", "type": "SCSI"}]},
                    {"id": "b", "endpoints": [{"uid": "p", "type": "SCSI"}]}]})",
     "t.json: arrays[1].endpoints[0].uid: another protocol endpoint has the uid \"p\""},
    {"EndpointAccessibleNoBool", withEndpoint(R"({"type": "SCSI", "accessible": 1})"),
     "t.json: arrays[0].endpoints[0].accessible: true or false is expected, not 1"},
    {"EndpointOfAnotherTransport", withEndpoint(R"({"type": "SCSI", "ipAddress": "x"})"),
     "t.json: arrays[0].endpoints[0].ipAddress: an endpoint of type SCSI has no such member"},
    {"EndpointNfsWithAddresses", withEndpoint(R"({"type": "NFS", "addresses": []})"),
     "t.json: arrays[0].endpoints[0].addresses: an endpoint of type NFS has no such member"},
    {"EndpointOfNumberWithMount", withEndpoint(R"({"type": 9, "serverMount": "x"})"),
     "t.json: arrays[0].endpoints[0].serverMount: an endpoint of type 9 has no such member"},
    {"EndpointAddressNull", withEndpoint(R"({"type": "NFS4x", "addresses": ["x", null]})"),
     "t.json: arrays[0].endpoints[0].addresses[1]: a text is expected, not null"},

    // Containers.
    {"ContainerIdNoUuid", R"({"arrays": [], "containers": [{"id": "gold"}]})",
     "t.json: containers[0].id: a UUID is expected, not \"gold\""},
    {"ContainerIdTwiceInAnotherSpelling",
     R"({"arrays": [], "containers": [
        {"id": "00000000-0000-4000-8000-00000000000a", "name": "x", "maxLumoSizeMb": 1},
        {"id": "{0000000000004000800000000000000A}", "name": "y", "maxLumoSizeMb": 1}]})",
     "t.json: containers[1].id: another storage container has the id 00000000-0000-4000-8000-00000000000a"},
    {"ContainerWithoutName", withContainer(""), "t.json: containers[0]: the member \"name\" is missing"},
    {"ContainerNameEmpty", withContainer(R"(, "name": "")"),
     "t.json: containers[0].name: an empty text is not allowed here"},
    {"ContainerWithoutMaximum", withContainer(R"(, "name": "c")"),
     "t.json: containers[0]: the member \"maxLumoSizeMb\" is missing"},
    {"ContainerMaximumZero", withContainer(R"(, "name": "c", "maxLumoSizeMb": 0)"),
     "t.json: containers[0].maxLumoSizeMb: a whole number from 1 to 9223372036854775807 is expected, not 0"},
    {"ContainerMaximumFraction", withContainer(R"(, "name": "c", "maxLumoSizeMb": 1.5)"),
     "t.json: containers[0].maxLumoSizeMb: a whole number from 1 to 9223372036854775807 is expected, not the number "
     "1.5"},
    {"ContainerMaximumTooLarge", withContainer(R"(, "name": "c", "maxLumoSizeMb": 9223372036854775808)"),
     "t.json: containers[0].maxLumoSizeMb: a whole number from 1 to 9223372036854775807 is expected, not "
     "9223372036854775808"},
    {"ContainerMaximumText", withContainer(R"(, "name": "c", "maxLumoSizeMb": "1")"),
     "t.json: containers[0].maxLumoSizeMb: a whole number is expected, not the text \"1\""},
    {"ContainerOnNoArray", withContainer(R"(, "name": "c", "maxLumoSizeMb": 1, "arrays": ["a", "z"])"),
     "t.json: containers[0].arrays[1]: there is no storage array with the id \"z\""},
    {"ContainerArrayTwice", withContainer(R"(, "name": "c", "maxLumoSizeMb": 1, "arrays": ["a", "b", "a"])"),
     "t.json: containers[0].arrays[2]: the storage array \"a\" stands here twice"},

    // Volumes.
    {"VolumeIdNoUuid", withVolumes(R"({"uuid": "v"})"),
     "t.json: containers[0].volumes[0].uuid: a UUID is expected, not \"v\""},
    {"VolumeIdTwice", withVolumes(R"({"uuid": "00000000-0000-4000-8000-000000000002", "directoryName": "d"},
                    {"uuid": "00000000-0000-4000-8000-000000000002", "directoryName": "e"})"),
     "t.json: containers[0].volumes[1].uuid: another virtual volume has the id 00000000-0000-4000-8000-000000000002"},
    {"VolumeWithoutDirectoryName", withVolumes(R"({"uuid": "00000000-0000-4000-8000-000000000002"})"),
     "t.json: containers[0].volumes[0]: the member \"directoryName\" is missing"},
    {"VolumeDirectoryNameTwice", withVolumes(R"({"uuid": "00000000-0000-4000-8000-000000000002", "directoryName": "d"},
                    {"uuid": "00000000-0000-4000-8000-000000000003", "directoryName": "d"})"),
     "t.json: containers[0].volumes[1].directoryName: another virtual volume of the container has the directory name "
     "\"d\""},
    {"VolumeKindUnknown", withVolume(R"(, "kind": "Data")"),
     "t.json: containers[0].volumes[0].kind: config or data is expected, not \"Data\""},
    {"DataVolumeWithDirectoryName", withVolume(R"(, "kind": "data")"),
     "t.json: containers[0].volumes[0].directoryName: a data volume has no directory name"},
    {"VolumeAboveTheMaximum", withVolume(R"(, "sizeMb": 101)"),
     "t.json: containers[0].volumes[0].sizeMb: a whole number from 1 to 100 is expected, not 101"},
    {"VolumeCommitsMoreThanItsSize", withVolume(R"(, "sizeMb": 10, "committedMb": 11)"),
     "t.json: containers[0].volumes[0].committedMb: a whole number from 0 to 10 is expected, not 11"},
    {"VolumeCommitsMoreThanTheDefaultSize", withVolume(R"(, "committedMb": 101)"),
     "t.json: containers[0].volumes[0].committedMb: a whole number from 0 to 100 is expected, not 101"},
    {"VolumeUnsharesMoreThanItCommits", withVolume(R"(, "committedMb": 5, "unsharedMb": 6)"),
     "t.json: containers[0].volumes[0].unsharedMb: a whole number from 0 to 5 is expected, not 6"},
    {"VolumeBlockSizeNoPowerOfTwo", withVolume(R"(, "blockSize": 4095)"),
     "t.json: containers[0].volumes[0].blockSize: a power of two is expected, not 4095"},
    {"VolumeBlockSizeTooSmall", withVolume(R"(, "blockSize": 256)"),
     "t.json: containers[0].volumes[0].blockSize: a whole number from 512 to 1073741824 is expected, not 256"},
    {"VolumeBoundToNothing", withVolume(R"(, "boundTo": "pe-z")"),
     "t.json: containers[0].volumes[0].boundTo: there is no protocol endpoint with the uid \"pe-z\""},
    {"VolumeBoundToAnotherArray", withVolume(R"(, "boundTo": "pe-b")"),
     "t.json: containers[0].volumes[0].boundTo: the protocol endpoint \"pe-b\" belongs to no storage array of this "
     "container"},
    {"VolumeProfileNoText", withVolume(R"(, "profile": false)"),
     "t.json: containers[0].volumes[0].profile: a text is expected, not false"},
    {"MetadataNoList", withVolume(R"(, "metadata": {"k": "v"})"),
     "t.json: containers[0].volumes[0].metadata: a list is expected, not an object"},
    {"MetadataWithoutValue", withVolume(R"(, "metadata": [{"key": "k", "value": "v"}, {"key": "k"}])"),
     "t.json: containers[0].volumes[0].metadata[1]: the member \"value\" is missing"},
};

class TopologyMistakes : public ::testing::TestWithParam<Mistake> {};

} // namespace

TEST_P(TopologyMistakes, areToldWithTheirPlace) {
    auto const parse = [&] { Orka::parseTopology(GetParam().json, "t.json"); };
    EXPECT_EQ(failureOf(parse), GetParam().sentence);
    EXPECT_EQ(codeOf(parse), Wire::ErrorCode::InvalidArgument);
}

INSTANTIATE_TEST_SUITE_P(Topology, TopologyMistakes, ::testing::ValuesIn(mistakes),
                         [](auto const &mistake) { return std::string(mistake.param.name); });
