// SPDX-License-Identifier: Apache-2.0
//
// Directory names that nobody would choose. A provider may refuse each as an invalid argument; what it takes it has to
// keep byte for byte, and either way it goes on serving.
#include <algorithm>

#include "conformance/Cases.h"
#include "conformance/Probe.h"

namespace Orka::Conformance {

namespace {

struct HostileName {
    char const *title;
    char const *demand; ///< what the name is
    std::string suffix; ///< behind the kit's own prefix
};

std::vector<HostileName> hostileNames() {
    return {
        {"slash", "a slash", "a/b"},
        {"parent", "two dots and slashes", "/../../x"},
        {"backslash", "a backslash", "a\\b"},
        {"newline", "a newline", "a\nb"},
        {"carriage-return", "a carriage return", "a\rb"},
        {"tab", "a tab", "a\tb"},
        {"escape", "a terminal's escape sequence", "\x1b[2J\x1b]0;x\x07"},
        {"delete", "the character DEL", "a\x7f"},
        {"c1-control", "a C1 control character", "a\xc2\x9b"},
        {"bidi", "a turn of the direction of writing",
         // NOLINTNEXTLINE(misc-misleading-bidirectional): that is what is tried
         "a\xe2\x80\xae"
         "b"},
        {"combining", "a combining character", "e\xcc\x81"},
        {"emoji", "characters beyond 16 bits", "\xf0\x9f\x98\x80"},
        {"trailing-blank", "a blank at its end", "a "},
        {"trailing-dot", "a dot at its end", "a."},
        {"quotes", "quotes of every kind", "'\"`''"},
        {"sql", "a statement", "'; DELETE FROM volume; --"},
        {"json", "what ends a JSON text", "\",\"sizeMb\":1}"},
        {"xml", "what looks like an entity", "&lt;<!-- ]]>"},
        {"percent", "percent signs", "%s%n%00%2f"},
        {"query", "what separates parts of a URL", "?a=b&c#d;e"},
        {"shell", "what a shell would obey", "$(reboot)`x`|&"},
    };
}

std::vector<HostileName> invalidEncodings() {
    return {
        {"utf8-lone-byte", "a lone byte of UTF-8", "a\x80"},
        {"utf8-cut-short", "a character of UTF-8 that is cut short", "a\xe2\x82"},
        {"utf8-overlong", "an overlong form of UTF-8", "a\xc0\xaf"},
        {"utf8-surrogate", "a surrogate in UTF-8", "a\xed\xa0\x80"},
        {"latin-1", "bytes of Latin-1", "\xe4\xf6\xfc"},
    };
}

/// Refused as an invalid argument, or there exactly as it was asked for.
void refusedOrKept(Probe &probe, std::string const &name) {
    auto spec = probe.freshSpec();
    spec.directoryName = name;
    auto const before = probe.list(probe.containerId());
    auto const outcome = probe.tryMake(spec);
    if (!outcome.ok()) {
        expectFailure("the name is kept, or is an invalid argument",
                      {Wire::ErrorCode::InvalidArgument, Wire::ErrorCode::TooLarge}, outcome);
        expectEqual("the container's volumes after a refusal", before, probe.list(probe.containerId()));
        return;
    }
    auto const &made = outcome.value();
    expectEqual("the name in the answer", name, made.directoryName);
    expectEqual("the name that is stored", name, probe.facts(made).directoryName);
    expectEqual("the name in the list", name, probe.list(probe.containerId()).back().directoryName);
    expectEqual("the volume of the name", std::optional<VirtualVolume>(made), probe.byName(probe.containerId(), name));
    auto const metadata = expectSuccess(
        "its metadata", probe.ask(probe.provider().getMetadata(probe.context(), made.containerId, made.uuid)));
    expectEqual("the name among its metadata", Metadata{{"directoryName", name}}, metadata);
}

void asking(Probe &probe, std::string const &name) {
    auto const outcome =
        probe.ask(probe.provider().queryVirtualVolumeByDirectoryName(probe.context(), probe.containerId(), name));
    if (outcome.ok()) {
        expectEqual("the volume of a name that none has", std::optional<VirtualVolume>(), outcome.value());
    } else {
        expectFailure("nothing, or an invalid argument", Wire::ErrorCode::InvalidArgument, outcome);
    }
    probe.list(probe.containerId(), 1);
}

void ofLength(Probe &probe, size_t bytes) {
    auto name = probe.freshName() + '-';
    name.resize(std::max(bytes, name.size()), 'n');
    refusedOrKept(probe, name);
}

void mustBeKept(Probe &probe, size_t bytes) {
    auto spec = probe.freshSpec();
    spec.directoryName += '-';
    spec.directoryName.resize(std::max(bytes, spec.directoryName.size()), 'n');
    auto const made = probe.make(spec);
    expectEqual("the name that is stored", spec.directoryName, probe.facts(made).directoryName);
}

void nul(Probe &probe) {
    auto spec = probe.freshSpec();
    auto const stem = spec.directoryName;
    spec.directoryName += std::string("\0x", 2);
    auto const outcome = probe.tryMake(spec);
    expectFailure("the character NUL in a name", Wire::ErrorCode::InvalidArgument, outcome);
    expectEqual("how many volumes have the name up to it", int64_t{0}, probe.countNamed(stem));
}

} // namespace

Cases hostileNameCases() {
    Cases cases;
    for (auto const &hostile : hostileNames()) {
        cases.push_back(
            {std::string("hostile/name/") + hostile.title,
             std::string("A name with ") + hostile.demand + " is kept exactly or refused.",
             [suffix = hostile.suffix](Probe &probe) { refusedOrKept(probe, probe.freshName() + suffix); }});
    }
    for (auto const &hostile : invalidEncodings()) {
        cases.push_back(
            {std::string("hostile/name/") + hostile.title,
             std::string("A name with ") + hostile.demand + " is kept exactly or refused.",
             [suffix = hostile.suffix](Probe &probe) { refusedOrKept(probe, probe.freshName() + suffix); }});
    }
    cases.push_back({"hostile/name/nul", "A name with the character NUL is refused, and not cut there.", nul});
    cases.push_back({"hostile/name/255-bytes", "A name of 255 bytes, as long as a directory's may be, is kept.",
                     [](Probe &probe) { mustBeKept(probe, 255); }});
    cases.push_back({"hostile/name/256-bytes", "A name of 256 bytes is kept exactly or refused.",
                     [](Probe &probe) { ofLength(probe, 256); }});
    cases.push_back({"hostile/name/64-kib", "A name of 64 KiB is kept exactly or refused.",
                     [](Probe &probe) { ofLength(probe, size_t{1} << 16); }});
    cases.push_back(
        {"hostile/name/asked-for", "Asking for hostile names finds nothing and harms nothing.", [](Probe &probe) {
             for (auto const &hostile : hostileNames()) {
                 asking(probe, probe.freshName() + hostile.suffix);
             }
             for (auto const &hostile : invalidEncodings()) {
                 asking(probe, probe.freshName() + hostile.suffix);
             }
         }});
    return cases;
}

} // namespace Orka::Conformance
