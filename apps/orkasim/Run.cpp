// SPDX-License-Identifier: Apache-2.0
#include "Run.h"

#include <algorithm>
#include <array>
#include <exception>
#include <ostream>

#include "wire/Failure.h"

namespace Orkasim {

namespace {

struct Command {
    char const *name;
    char const *arguments;
    char const *description;
    void (*execute)(Words const &, Console const &);
};

constexpr std::array<Command, 2> commands{{
    {"make", "[--force] TOPOLOGY ARRAYFILE",
     "makes an array file from a topology in JSON (- reads standard input); --force replaces an array file", make},
    {"show", "ARRAYFILE", "tells how much an array file holds", show},
}};

void writeUsage(std::ostream &stream) {
    stream << "usage:\n";
    for (auto const &command : commands) {
        stream << "  orkasim " << command.name << ' ' << command.arguments << "\n      " << command.description << '\n';
    }
}

bool asksForHelp(Words const &words) {
    // After "--" a word is what it is.
    auto const end = std::find(words.begin(), words.end(), "--");
    return std::any_of(words.begin(), end, [](auto const &word) { return word == "--help" || word == "-h"; });
}

void dispatch(Words const &words, Console const &console) {
    if (words.empty()) {
        throw UsageError("a command is missing");
    }
    auto const command = std::find_if(commands.begin(), commands.end(),
                                      [&](auto const &candidate) { return words.front() == candidate.name; });
    if (command == commands.end()) {
        throw UsageError("there is no command '" + words.front() + "'");
    }
    command->execute(Words(words.begin() + 1, words.end()), console);
}

} // namespace

ExitStatus run(Words const &words, Console const &console) {
    try {
        if (asksForHelp(words)) {
            writeUsage(console.out);
        } else {
            dispatch(words, console);
        }
    } catch (UsageError const &error) {
        console.err << "orkasim: " << printable(error.what()) << '\n';
        writeUsage(console.err);
        return ExitStatus::Usage;
    } catch (Wire::Failure const &failure) {
        console.err << "orkasim: " << printable(failure.sentence()) << '\n';
        return ExitStatus::Failed;
    } catch (std::exception const &error) {
        console.err << "orkasim: " << printable(error.what()) << '\n';
        return ExitStatus::Failed;
    }
    if (!console.out.flush()) {
        console.err << "orkasim: the output could not be written\n";
        return ExitStatus::OutputFailed;
    }
    return ExitStatus::Done;
}

} // namespace Orkasim
