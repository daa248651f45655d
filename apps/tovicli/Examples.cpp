// SPDX-License-Identifier: Apache-2.0
#include "Examples.h"

#include <string_view>

namespace Tovicli {

namespace {

/// A path stands at the line's beginning; below it, by two blanks, options, and by four, what they are for. One text,
/// so that it costs a program that shows no help nothing.
constexpr std::string_view examples = R"(storage internal lumo orkaprovider add
  --vp-name lab --vp-url file:///var/lib/tovi/arrays/lab.array
    Registers the provider of an array file; it serves every array in it.
  --vp-name lab --vp-url file:///var/lib/tovi/arrays/lab.array --arrayid array-north --priority 1 --isactive true
    For one array only, active, with a priority. Each further array takes the three options once more.
storage internal lumo orkaprovider set
  --vp-name lab --arrayid array-north --priority 5 --isactive true
    Gives the provider another priority for an array.
storage internal lumo orkaprovider remove
  --vp-name lab
    Forgets the provider. Its array keeps what it holds.
storage internal lumo orkaprovider activate
  --vp-name lab --arrayid array-north
    Lets the provider serve the array, whatever the priorities say.
storage internal lumo orkaprovider deactivate
  --vp-name lab --arrayid array-north
    Takes the array from the provider until it is activated again.
storage internal lumo orkaprovider injectfault
  --vp-name lab --status offline
    Lets the daemon treat the provider as if it were offline.
  --vp-name lab
    Takes that back.
storage internal lumo faultInjection enable
  --enabled true
    From now on fault rules count.
storage internal lumo faultInjection rule add
  --fault OUT_OF_RESOURCE --operation createVirtualVolume --frequency 3
    Every third creation of a volume fails.
  --fault STORAGE_FAULT --time 60000
    Once a minute, whichever operation comes first fails.
storage internal lumo faultInjection rule set
  --fault OUT_OF_RESOURCE --operation createVirtualVolume --frequency 1000
    Makes the rule fire less often.
storage internal lumo faultInjection rule remove
  --fault OUT_OF_RESOURCE --operation createVirtualVolume
    Removes the rule.
storage internal lumo storagecontainer load
  (none)
    Mounts every container that the providers export, and shows which.
  --format json
    The same for a program.
storage internal lumo storagecontainer add
  --container-name gold --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    Mounts one container under a name of its own.
storage internal lumo storagecontainer remove
  --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    Unmounts the container. The array keeps what it holds.
storage internal lumo storagecontainer checklumos
  --path /var/lib/tovi/volumes/gold
    Tells of every config volume of the container whether it can be reached.
  --path /var/lib/tovi/volumes/gold --lumo a1b20001-1111-4aaa-8aaa-000000000001
    Of one virtual volume. May be repeated.
storage internal lumo configlumo add
  --name vm-1 --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001 --size 1024
    Creates a config volume of 1 GB.
storage internal lumo configlumo remove
  --name vm-1 --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    Unmounts it and deletes it with all that it holds.
storage internal lumo configlumo umount
  --name vm-1 --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    Takes the directory away. What it holds is there again after the next mount.
storage internal lumo configlumo mount
  --name vm-1 --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001
    Makes it a directory of its container.
  --name vm-1 --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001 --priority
    Past the queue of other requests.
storage internal lumo daemon set
  --log-level verbose --dump-objects
    Lets the daemon log more, and write what it knows into its log.
  --unbind-now
    Ends the bindings of volumes that are not mounted, without waiting for the timer.
  --start-pe-apd pe-north-nfs-1
    Acts as if all paths to the endpoint were down.
storage internal lumo orkacontext set
  --uuid 7e1f0000-4c3b-4d55-8a1b-2c3d4e5f0001
    The host speaks to its providers on behalf of this context.
  --clear
    On behalf of none.
storage internal lumo virtualvolume get
  --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001 --uuid a1b20001-1111-4aaa-8aaa-000000000001
    Sizes, profile and block size of a volume.
storage internal lumo virtualvolume metadata list
  --container-id 3f1a52de-6c1b-4b57-9a0e-2d8c7e5b9001 --uuid a1b20001-1111-4aaa-8aaa-000000000001
    What the array has noted about a volume.
cli command list
  --format table
    Every command, and the plug-in that it comes from.
cli plugin list
  (none)
    The plug-ins, and what became of each.
cli plugin check
  --file /usr/lib/tovicli/plugins/liblumointernal.so
    Everything that is wrong with a plug-in, a line each.
cli doctor
  --timeout 2s
    Looks the host over; a daemon that does not answer is given two seconds.
)";

std::string_view takeLine(std::string_view &text) {
    std::string_view const line = text.substr(0, text.find('\n'));
    text.remove_prefix(line.size() + 1);
    return line;
}

/// "--a x --b" as "--a x", "--b"
void addOptions(std::vector<std::string> &pieces, std::string_view line) {
    while (!line.empty()) {
        std::size_t const end = std::min(line.find(" -", 1), line.size());
        pieces.emplace_back(line.substr(0, end));
        line.remove_prefix(std::min(end + 1, line.size()));
    }
}

std::vector<Example> keptExamples(std::string_view path, std::vector<std::string> const &start) {
    std::vector<Example> found;
    std::string_view rest = examples;
    bool here = false;
    while (!rest.empty()) {
        std::string_view const line = takeLine(rest);
        if (!line.starts_with("  ")) {
            here = line == path;
        } else if (here && line.starts_with("    ")) {
            found.back().purpose = line.substr(4);
        } else if (here) {
            found.push_back({start, {}});
            addOptions(found.back().pieces, line == "  (none)" ? std::string_view() : line.substr(2));
        }
    }
    return found;
}

} // namespace

std::vector<Example> examplesOf(Plexa::AutoCli::NamespaceNode &node, std::string const &program) {
    auto *const command = dynamic_cast<Plexa::AutoCli::Command *>(&node);
    if (command == nullptr) {
        return {};
    }
    std::vector<Example> found;
    for (auto const &[line, purpose] : command->GetExamples()) {
        bool const whole = line.starts_with(program + " ");
        found.push_back({{whole ? line : program + " " + line}, purpose});
    }
    if (!found.empty()) {
        return found;
    }
    std::vector<std::string> start = {program};
    for (std::string const &word : node.GetPath()) {
        start.push_back(word);
    }
    return keptExamples(node.GetPathString(' '), start);
}

std::vector<std::string> pathsWithExamples() {
    std::vector<std::string> paths;
    for (std::string_view rest = examples; !rest.empty();) {
        std::string_view const line = takeLine(rest);
        if (!line.starts_with("  ")) {
            paths.emplace_back(line);
        }
    }
    return paths;
}

} // namespace Tovicli
