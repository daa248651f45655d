// SPDX-License-Identifier: Apache-2.0
//
// Ids, sizes, keys, profiles and contexts that nobody would choose.
#include "conformance/Cases.h"
#include "conformance/Operations.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

using Wire::ErrorCode;

struct HostileText {
    char const *title;
    char const *demand;
    std::string text;
};

std::vector<HostileText> hostileTexts() {
    return {
        {"empty", "an empty text", ""},
        {"no-uuid", "a text that is no UUID", "no uuid"},
        {"control", "control characters", "\x1b[2J\r\n"},
        {"nul", "the character NUL", std::string("a\0b", 3)},
        {"invalid-utf8", "bytes that are no UTF-8", "\xff\xfe\x80"},
        {"path", "what looks like a path", "../../../../etc/passwd"},
        {"long", "a text of 64 KiB", std::string(size_t{1} << 16, 'x')},
    };
}

/// Every operation that names a container, on one that cannot be.
void asContainer(Probe &probe, std::string const &text) {
    auto const made = probe.make();
    Subject const subject{text, made.uuid, probe.ground().endpoint(), probe.freshName()};
    for (auto const &operation : operations()) {
        if (operation.namesContainer) {
            expectFailure(std::string("the container's id of \"") + operation.name + '"',
                          {ErrorCode::NoSuchContainer, ErrorCode::InvalidArgument},
                          probe.ask(operation.perform(probe.provider(), probe.context(), subject)));
        }
    }
    expectEqual("the volume afterwards", made, probe.facts(made));
}

void asVolume(Probe &probe, std::string const &text) {
    Subject const subject{probe.containerId(), text, probe.ground().endpoint(), probe.freshName()};
    for (auto const &operation : operations()) {
        if (operation.namesVolume) {
            expectFailure(std::string("the volume's id of \"") + operation.name + '"',
                          {ErrorCode::NoSuchVolume, ErrorCode::InvalidArgument},
                          probe.ask(operation.perform(probe.provider(), probe.context(), subject)));
        }
    }
    probe.list(probe.containerId(), 1);
}

void asEndpoint(Probe &probe, std::string const &text) {
    auto const made = probe.make();
    expectFailure("the endpoint's uid", {ErrorCode::NoSuchEndpoint, ErrorCode::InvalidArgument},
                  probe.tryBind(made, text));
    expectEqual("the volume afterwards", made, probe.facts(made));
}

/// A profile, or a virtual machine: kept exactly, or refused.
void asText(Probe &probe, std::string const &text, bool isProfile) {
    auto spec = probe.freshSpec();
    if (isProfile) {
        spec.profile = text;
    } else {
        spec.vmUuid = text;
    }
    auto const outcome = probe.tryMake(spec);
    if (!outcome.ok()) {
        expectFailure("the text is kept, or is an invalid argument", {ErrorCode::InvalidArgument, ErrorCode::TooLarge},
                      outcome);
        expectEqual("how many volumes have the name", int64_t{0}, probe.countNamed(spec.directoryName));
        return;
    }
    auto const stored = probe.facts(outcome.value());
    expectEqual("the profile that is stored", spec.profile, stored.profile);
    expectEqual("the virtual machine that is stored", spec.vmUuid, stored.vmUuid);
}

/// A key that is taken is a key like any other.
void asKey(Probe &probe, std::string const &text) {
    auto const key = probe.freshKey() + text;
    auto const spec = probe.freshSpec();
    auto const first = probe.tryMake(spec, key);
    if (!first.ok()) {
        expectFailure("the key is taken, or is an invalid argument", {ErrorCode::InvalidArgument, ErrorCode::TooLarge},
                      first);
        expectEqual("how many volumes have the name", int64_t{0}, probe.countNamed(spec.directoryName));
        return;
    }
    expectEqual("the first answer again", first.value(),
                expectSuccess("the making repeated with its key", probe.tryMake(spec, key)));
    expectFailure("the key with something else", ErrorCode::InvalidArgument, probe.tryMake(probe.freshSpec(), key));
}

void asContext(Probe &probe, std::string const &text) {
    auto context = probe.context();
    context.orkaContext = text;
    auto const outcome = probe.ask(probe.provider().setContext(std::move(context)));
    if (!outcome.ok()) {
        expectFailure("the context is taken, or is an invalid argument",
                      {ErrorCode::InvalidArgument, ErrorCode::TooLarge}, outcome);
    }
    expectSuccess("the context is taken back", probe.ask(probe.provider().setContext(probe.context())));
    probe.list(probe.containerId(), 1);
}

void asSize(Probe &probe, int64_t sizeMb) {
    auto spec = probe.freshSpec();
    spec.sizeMb = sizeMb;
    auto const code = sizeMb < 0 ? ErrorCode::InvalidArgument : ErrorCode::TooLarge;
    if (sizeMb >= 0 && sizeMb <= probe.ground().container().maxLumoSizeMb) {
        throw Inapplicable{"the container takes volumes of this size"};
    }
    expectFailure("a size of " + std::to_string(sizeMb) + " MB", code, probe.tryMake(spec));
    expectEqual("how many volumes have the name", int64_t{0}, probe.countNamed(spec.directoryName));
}

struct HostileRole {
    char const *name;
    char const *demand; ///< of a text, after "A <role> that is ..."
    std::function<void(Probe &, std::string const &)> play;
};

} // namespace

Cases hostileArgumentCases() {
    std::vector<HostileRole> const roles{
        {"container", "As a container's id, %s is refused.", asContainer},
        {"volume", "As a volume's id, %s is refused.", asVolume},
        {"endpoint", "As an endpoint's uid, %s is refused.", asEndpoint},
        {"profile", "As a profile, %s is kept exactly or refused.",
         [](Probe &probe, std::string const &text) { asText(probe, text, true); }},
        {"machine", "As a virtual machine's id, %s is kept exactly or refused.",
         [](Probe &probe, std::string const &text) { asText(probe, text, false); }},
        {"key", "In a key, %s makes it a key of its own, or is refused.", asKey},
        {"context", "As a context, %s is taken or refused, and harms nothing.", asContext},
    };
    Cases cases;
    for (auto const &role : roles) {
        for (auto const &hostile : hostileTexts()) {
            std::string demand = role.demand;
            demand.replace(demand.find("%s"), 2, hostile.demand);
            cases.push_back({std::string("hostile/") + role.name + '/' + hostile.title, std::move(demand),
                             [play = role.play, text = hostile.text](Probe &probe) { play(probe, text); }});
        }
    }
    cases.push_back({"hostile/size/smallest", "The smallest number of 64 bits is no size.",
                     [](Probe &probe) { asSize(probe, std::numeric_limits<int64_t>::min()); }});
    cases.push_back({"hostile/size/largest", "The largest number of 64 bits is too large a size.",
                     [](Probe &probe) { asSize(probe, std::numeric_limits<int64_t>::max()); }});
    cases.push_back({"hostile/size/beyond-bytes", "A size whose bytes do not fit 64 bits is too large.",
                     [](Probe &probe) { asSize(probe, int64_t{1} << 44); }});
    cases.push_back({"hostile/size/beyond-doubles", "A size that no double holds is too large.",
                     [](Probe &probe) { asSize(probe, (int64_t{1} << 53) + 1); }});
    return cases;
}

} // namespace Orka::Conformance
