// SPDX-License-Identifier: Apache-2.0
#include "Pages.h"

#include "Examples.h"
#include "ExitStatus.h"
#include "Roff.h"
#include "Settings.h"
#include "plexa/Declaration.h"

namespace Tovicli::Manual {

using namespace Plexa;

namespace {

constexpr char const *program = "tovicli";
/// Columns of an example; a page's text is indented by 7, and 80 is what a terminal has.
constexpr std::size_t exampleWidth = 70;

struct Variable {
    char const *name;
    char const *meaning;
};
constexpr Variable variables[] = {
    {"TOVI_ROOT, TOVI_FORMAT, TOVI_TIMEOUT_MS, TOVI_LOG_LEVEL, TOVI_PLUGINS",
     "What the global options of these names are without the option. The timeout is in milliseconds."},
    {"TOVI_REQUEST_ID",
     "Names the run in the daemon's log, in error documents and traces: letters, digits and any of -_.: (default: 32 "
     "random digits)."},
    {"TOVI_OFFLINE", "When set, no daemon is asked; a request fails at once."},
    {"NO_COLOR, TERM, COLUMNS", "When and how output for people is coloured and how wide it is."},
};
constexpr Variable files[] = {
    {"ROOT/host.db", "What the host has been told: providers, mounted containers, config volumes, outages."},
    {"ROOT/volumes/", "Mounted containers."},
    {"ROOT/run/lumod.sock", "Where the daemon listens."},
    {"ROOT/log/lumod.log", "What the daemon has noted, each line with the request id of the run that caused it."},
};

/// One line, and no full stop: as an index of pages wants it.
std::string summaryOf(std::string text) {
    while (text.ends_with('.') || text.ends_with(' ')) {
        text.pop_back();
    }
    return text;
}

std::string options(std::vector<DeclaredOption> const &declared) {
    std::string text;
    for (DeclaredOption const &option : declared) {
        text += label((option.alias.empty() ? "" : bold(option.alias) + ", ") + bold(option.name) +
                      (option.value.empty() ? "" : " " + italic(option.value)));
        std::string const told = option.notes() + option.description;
        text += (told.empty() ? "\\&" : roff(told)) + "\n";
    }
    return text;
}

std::string result(AutoCli::Command &command) {
    DeclaredResult const declared = declaredResult(command);
    if (declared.what.empty()) {
        return {};
    }
    std::string text = section("RESULT") + roff(declared.what) + "\n";
    std::size_t depth = 0;
    for (DeclaredField const &field : declared.fields) {
        for (; depth < field.depth; ++depth) {
            text += ".RS\n";
        }
        for (; depth > field.depth; --depth) {
            text += ".RE\n";
        }
        text += label(bold(field.name)) + roff(field.kind) + "\n";
    }
    for (; depth > 0; --depth) {
        text += ".RE\n";
    }
    return text;
}

std::string examples(AutoCli::Command &command) {
    std::string text;
    for (Example const &example : examplesOf(command, program)) {
        std::string lines;
        appendPieces(lines, example.pieces, 0, 4, exampleWidth, " \\");
        text += ".PP\n" + roff(example.purpose) + "\n.PP\n" + verbatim(lines);
    }
    return text.empty() ? text : section("EXAMPLES") + text;
}

std::string statuses() {
    std::string text = section("EXIT STATUS");
    for (ExitMeaning const &each : exitMeanings) {
        text += label(bold(each.status)) + roff(each.meaning) + "\n";
    }
    return text;
}

std::string table(char const *title, Variable const *first, Variable const *end) {
    std::string text = section(title);
    for (; first != end; ++first) {
        text += label(bold(first->name)) + roff(first->meaning) + "\n";
    }
    return text;
}

std::string reference(std::string const &page, int number) {
    return bold(page) + "(" + std::to_string(number) + ")";
}

} // namespace

std::string pageName(AutoCli::Command &command) {
    return std::string(program) + "-" + command.GetPathString('-');
}

std::string commandPage(AutoCli::Command &command,
                        std::vector<boost::shared_ptr<AutoCli::NamespaceNode>> const &siblings,
                        std::string const &version) {
    std::string page = pageHead(pageName(command), 1, version);
    page += section("NAME") + roff(pageName(command)) + " \\- " + roff(summaryOf(command.GetDescription())) + "\n";
    page += section("SYNOPSIS") + bold(std::string(program) + " " + command.GetPathString(' ')) + "\n";
    std::vector<std::string> const pieces = usagePieces(command, program);
    for (std::size_t i = 1 + command.GetPath().size(); i < pieces.size(); ++i) {
        page += roff(pieces[i]) + "\n";
    }
    page += section("DESCRIPTION") + roff(command.GetDescription()) + "\n";
    if (std::vector<DeclaredOption> const own = declaredOptions(command); !own.empty()) {
        page += section("OPTIONS") + options(own);
    }
    page += ".PP\nThe global options are described in " + reference(program, 1) + ".\n";
    page += result(command) + examples(command) + statuses();
    page += section("SEE ALSO") + reference(program, 1);
    for (auto const &sibling : siblings) {
        auto *const other = dynamic_cast<AutoCli::Command *>(sibling.get());
        if (other != nullptr && other != &command) {
            page += ",\n" + reference(pageName(*other), 1);
        }
    }
    return page + ",\n" + reference("lumod", 8) + "\n";
}

std::string toolPage(DeclaredTree const &tree, std::string const &version) {
    std::string page = pageHead(program, 1, version);
    page += section("NAME") + "tovicli \\- run a command on a Tovi host\n";
    page += section("SYNOPSIS") + bold(program) + " [global options] " + italic("NAMESPACE") + "... " +
            italic("COMMAND") + " [options]\n";
    page += section("DESCRIPTION") + roff("Commands hang in a tree of namespaces, which plug-ins bring along. A "
                                          "namespace alone lists what it holds; --help behind any word tells what it "
                                          "is. Each command has a page of its own.\n");
    page += section("GLOBAL OPTIONS") + roff("They may stand before, within and behind the path; behind a command that "
                                             "declares the same name, the name is the command's.\n");
    page += options(declaredOptions(*globalOptions()));
    page += section("COMMANDS");
    for (auto const &command : tree.commands()) {
        page += label(bold(command->GetPathString(' '))) + roff(command->GetDescription()) + "\n";
    }
    page += table("ENVIRONMENT", std::begin(variables), std::end(variables));
    page += table("FILES", std::begin(files), std::end(files));
    page += statuses();
    page += section("DIAGNOSTICS");
    page += roff("What failed is told on standard error in one line, \"tovicli: what failed: cause (hint)\". In a "
                 "machine format, whichever it is, standard error holds one JSON document in one line, or nothing: "
                 "{\"error\":{...}} with message, cause, code, hint, requestId and warnings, or {\"warnings\":[...]} "
                 "when it went well all the same.\n");
    page += ".PP\n" + roff("A command that takes longer than half a second shows for how long, and where the host "
                           "counts, how many of how many, on a terminal; the line is gone before the result. "
                           "--log-level trivia tells each step of the run in a line of its own.\n");
    return page + section("SEE ALSO") + reference("lumod", 8) + ",\n" + reference("orkasim", 1) + "\n";
}

std::string helpPage(std::string const &other, int number, std::string const &summary, std::string const &help,
                     std::string const &version) {
    return pageHead(other, number, version) + section("NAME") + roff(other) + " \\- " + roff(summary) + "\n" +
           section("DESCRIPTION") + verbatim(help) + section("SEE ALSO") + reference(program, 1) + "\n";
}

} // namespace Tovicli::Manual
