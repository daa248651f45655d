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

constexpr std::array<Command, 3> commands{{
    {"make", "[--force] TOPOLOGY ARRAYFILE",
     "makes an array file from a topology in JSON (- reads standard input); --force replaces an array file", make},
    {"show", "ARRAYFILE", "tells how much an array file holds", show},
    {"serve", "[options] ARRAYFILE",
     "serves an array file over HTTPS and prints its URL; SIGTERM ends it\n"
     "      --listen ADDRESS:PORT  where (127.0.0.1:0: any free port of this host)\n"
     "      --cert FILE --key FILE what it identifies itself by, in PEM; made and kept there when they are missing\n"
     "      --cert-name NAME       whom a certificate that is made speaks for (the address)\n"
     "      --expired-cert         makes one that is no longer valid\n"
     "      --ready-file FILE      holds the URL when clients can come\n"
     "      --latency MS           waits before every answer\n"
     "      --error-rate PERCENT   so many requests are answered with status 503; --seed N chooses which\n"
     "      --misbehave NAME       hang, drip, endless, huge, bomb, garbage, truncated, redirect, reset, unavailable\n"
     "      --on OPERATION         misbehaves in this operation only\n"
     "      --times N              misbehaves so many times, then no more\n"
     "      --bug NAME             breaks one promise of a provider's; --bug help lists which there are",
     serve},
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
