// SPDX-License-Identifier: Apache-2.0
#include "handlers/Handlers.h"

#include <algorithm>
#include <unordered_set>

#include <fmt/format.h>

namespace Lumod {

namespace {

using Names = std::vector<std::string>;

/// What a name takes besides its bytes, about.
constexpr std::size_t nameBytes = 16;

bool hasEndpoint(Orka::StorageArray const &array, std::string const &uid) {
    return std::any_of(array.endpoints.begin(), array.endpoints.end(),
                       [&uid](Orka::Endpoint const &endpoint) { return endpoint.uid == uid; });
}

/// The arrays of an endpoint, as places in the view. @throws NoSuchEndpoint
std::unordered_set<uint32_t> arraysOf(Survey const &survey, std::string const &uid) {
    std::unordered_set<uint32_t> places;
    std::vector<ServedArray> const &arrays = survey.view->arrays();
    for (uint32_t place = 0; place < arrays.size(); ++place) {
        if (hasEndpoint(*arrays[place].facts, uid)) {
            places.insert(place);
        }
    }
    if (places.empty() && !survey.failed.empty()) {
        throw survey.failed.front().reason;
    }
    if (places.empty()) {
        throw Wire::Failure(Wire::ErrorCode::NoSuchEndpoint,
                            fmt::format("no registered provider has a protocol endpoint '{}'", uid));
    }
    return places;
}

Names containersOn(View const &view, std::unordered_set<uint32_t> const &arrays) {
    Names names;
    for (ServedContainer const &container : view.containers()) {
        bool const isServed = std::any_of(container.arrays.begin(), container.arrays.end(),
                                          [&arrays](uint32_t place) { return arrays.count(place) != 0; });
        if (isServed) {
            names.push_back(container.facts->name);
        }
    }
    return names;
}

ReplyPtr replyOf(Names names) {
    auto const shared = std::make_shared<Names const>(std::move(names));
    return listReply(
        shared->size(), [shared](std::size_t at) { return nameBytes + (*shared)[at].size(); },
        [](Wire::Reply::Builder reply, unsigned size) { return reply.initContainerNames(size); },
        [shared](auto &list, unsigned place, std::size_t at) { list.set(place, (*shared)[at].c_str()); });
}

} // namespace

Answer<ReplyPtr> protocolEndpointEvent(Core &core, CallPtr const &call, Wire::Request::Reader request) {
    Wire::ProtocolEndpointEvent::Reader const event = request.getProtocolEndpointEvent();
    std::string uid = textOf(event.getEndpoint());
    bool const apd = event.getApd();
    return andThen(core.surveyor.survey(call), [&core, call, uid = std::move(uid), apd](Survey survey) {
        std::unordered_set<uint32_t> const arrays = arraysOf(survey, uid);
        core.outages.note(uid, apd);
        core.log.write(LogLevel::Warning, call->trace,
                       fmt::format("all paths down {} on the protocol endpoint {}", apd ? "begins" : "ends", uid));
        return replyOf(containersOn(*survey.view, arrays));
    });
}

} // namespace Lumod
