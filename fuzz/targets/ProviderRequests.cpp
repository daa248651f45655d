// SPDX-License-Identifier: Apache-2.0
//
// A client of the array simulator's service sends any bytes over a connection (inside TLS, which is not ours): HTTP,
// paths, JSON and what it asks of an array. Each input meets the same array, fresh.
#include <string>

#include <kj/compat/http.h>
#include <rapidjson/document.h>
#include <rapidjson/memorystream.h>

#include "Property.h"
#include "SampleArray.h"
#include "Scratch.h"
#include "World.h"
#include "orka/ArrayFile.h"
#include "orka/Embedded.h"
#include "orka/Service.h"
#include "orka/Topology.h"
#include "plexa/Text.h"

namespace {

using Fuzz::require;

struct Array {
    Array() {
        Orka::makeArrayFile(Orka::parseTopology(Fuzz::sampleTopology, "topology"), path(), Orka::Replace::Never);
        bytes = Fuzz::readFile(path());
    }
    std::string path() const {
        return directory.at("served.array");
    }

    Fuzz::ScratchDirectory directory;
    std::string bytes;
};

void checkBody(std::string_view body) {
    rapidjson::MemoryStream stream(body.data(), body.size());
    rapidjson::Document document;
    document.ParseStream<rapidjson::kParseIterativeFlag | rapidjson::kParseValidateEncodingFlag, rapidjson::UTF8<>>(
        stream);
    require(!document.HasParseError() && document.IsObject(), "an answer is a JSON object", body);
    require(Plexa::isValidUtf8(body), "an answer is UTF-8", body);
}

/// Every answer is HTTP; those of the service, which say that they are JSON, are.
void checkAnswers(std::string_view heard) {
    constexpr std::string_view endOfHead = "\r\n\r\n";
    constexpr std::string_view length = "Content-Length: ";
    while (!heard.empty()) {
        require(heard.starts_with("HTTP/1.1 "), "an answer is HTTP", heard);
        std::size_t const headEnd = heard.find(endOfHead);
        require(headEnd != std::string_view::npos, "a head is whole", heard);
        std::string_view const head = heard.substr(0, headEnd);
        heard.remove_prefix(headEnd + endOfHead.size());
        std::size_t const announced = head.find(length);
        if (announced == std::string_view::npos) {
            return; // what the library says itself, or nothing that has a body
        }
        auto const bytes =
            static_cast<std::size_t>(std::stoul(std::string(head.substr(announced + length.size(), 12))));
        require(bytes <= heard.size(), "an answer is whole", head);
        if (head.find("application/json") != std::string_view::npos) {
            checkBody(heard.substr(0, bytes));
        }
        heard.remove_prefix(bytes);
    }
}

void serve(std::string const &path, std::string_view says) {
    Fuzz::World world;
    unsigned made = 0;
    Orka::ProviderSurroundings const surroundings{world.timer(), [&made] {
                                                      std::string uuid = "00000000-0000-4000-8000-000000000000";
                                                      std::string const number = std::to_string(++made);
                                                      return uuid.replace(uuid.size() - number.size(), number.size(),
                                                                          number);
                                                  }};
    Orka::EmbeddedProvider provider(path, surroundings);
    Orka::ProviderService service(provider, world.timer(), "/orka", "instance");
    auto const table = Orka::ProviderService::headerTable();
    kj::HttpServer server(world.timer(), *table, service);
    auto pipe = kj::newTwoWayPipe();
    Fuzz::Peer peer(kj::mv(pipe.ends[0]), says);
    auto serving = server.listenHttp(kj::mv(pipe.ends[1])).eagerlyEvaluate([](kj::Exception &&) {});
    checkAnswers(world.finish(peer.heard()));
    world.finish(kj::mv(serving));
}

} // namespace

int LLVMFuzzerTestOneInput(std::uint8_t const *data, std::size_t size) {
    static Array const array;
    Fuzz::removeFile(array.path() + "-journal");
    Fuzz::writeFile(array.path(), array.bytes);
    serve(array.path(), Fuzz::textOf(data, size));
    // Whatever was asked, what it left is sound.
    Orka::ArrayFile file(array.path());
    file.checkIntegrity();
    return 0;
}
