// SPDX-License-Identifier: Apache-2.0
#include "Options.h"

#include <array>
#include <charconv>
#include <string_view>
#include <utility>
#include <vector>

#include <getopt.h>
#include <grp.h>

#include <fmt/format.h>

#include "lumod/Daemon.h"
#include "wire/Failure.h"

namespace {

using Wire::ErrorCode;
using Wire::Failure;

enum Letter : int {
    Root = 'r',
    LogLevelOption = 'l',
    UnbindPeriod = 'u',
    Group = 'g',
    Foreground = 'f',
    Help = 'h',
    Version = 'V'
};

constexpr std::array<option, 8> longOptions{{{"root", required_argument, nullptr, Root},
                                             {"log-level", required_argument, nullptr, LogLevelOption},
                                             {"unbind-period", required_argument, nullptr, UnbindPeriod},
                                             {"group", required_argument, nullptr, Group},
                                             {"foreground", no_argument, nullptr, Foreground},
                                             {"help", no_argument, nullptr, Help},
                                             {"version", no_argument, nullptr, Version},
                                             {nullptr, 0, nullptr, 0}}};

[[noreturn]] void refuse(std::string const &sentence) {
    throw Failure(ErrorCode::InvalidArgument, sentence);
}

Lumod::LogLevel levelOf(std::string_view from, std::string_view word) {
    auto const level = Lumod::logLevelNamed(word);
    if (!level) {
        refuse(fmt::format("{}: '{}' is no log level; expected quiet, panic, error, warning, info, verbose or trivia",
                           from, word));
    }
    return *level;
}

int64_t periodOf(std::string_view text) {
    int64_t microseconds = 0;
    auto const end = text.data() + text.size();
    auto const parsed = std::from_chars(text.data(), end, microseconds);
    if (parsed.ec != std::errc() || parsed.ptr != end || microseconds <= 0 ||
        microseconds > Lumod::longestUnbindPeriodUs) {
        refuse(fmt::format("--unbind-period: '{}' is no period; expected a number of microseconds from 1 to {}", text,
                           Lumod::longestUnbindPeriodUs));
    }
    return microseconds;
}

gid_t groupOf(char const *name) {
    std::vector<char> buffer(16384);
    group entry{};
    group *found = nullptr;
    if (::getgrnam_r(name, &entry, buffer.data(), buffer.size(), &found) != 0 || found == nullptr) {
        refuse(fmt::format("--group: there is no group '{}'", name));
    }
    return entry.gr_gid;
}

} // namespace

Options parseOptions(int count, char **arguments, std::string root, std::string const &logLevel) {
    Options options;
    options.root = std::move(root);
    if (!logLevel.empty()) {
        options.logLevel = levelOf("TOVI_LOG_LEVEL", logLevel);
    }
    opterr = 0;
    optind = 1;
    for (;;) {
        int const letter = ::getopt_long(count, arguments, ":", longOptions.data(), nullptr);
        if (letter == -1) {
            break;
        }
        switch (letter) {
        case Root:
            options.root = optarg;
            break;
        case LogLevelOption:
            options.logLevel = levelOf("--log-level", optarg);
            break;
        case UnbindPeriod:
            options.unbindPeriodUs = periodOf(optarg);
            break;
        case Group:
            options.group = groupOf(optarg);
            break;
        case Foreground:
            break; // the only mode there is
        case Help:
            options.help = true;
            break;
        case Version:
            options.version = true;
            break;
        case ':':
            refuse(fmt::format("the option {} needs a value", arguments[optind - 1]));
        default:
            refuse(fmt::format("unknown option {}", arguments[optind - 1]));
        }
    }
    if (optind < count) {
        refuse(fmt::format("unexpected argument '{}'", arguments[optind]));
    }
    if (options.root.empty()) {
        refuse("--root: a directory is expected");
    }
    return options;
}

std::string helpText() {
    return "Usage: lumod [options]\n"
           "\n"
           "The Lumo daemon: talks to the storage providers of one host and answers tovicli.\n"
           "\n"
           "  --root DIR           the host's directory (TOVI_ROOT; else /var/lib/tovi)\n"
           "  --log-level LEVEL    quiet, panic, error, warning, info, verbose or trivia (TOVI_LOG_LEVEL; else info)\n"
           "  --unbind-period US   how long an unmounted volume stays bound, in microseconds (300000000)\n"
           "  --group NAME         admit this group, besides root and the daemon's own user\n"
           "  --foreground         stay in the foreground, which it always does\n"
           "  --help               show this text\n"
           "  --version            show the version\n"
           "\n"
           "SIGTERM and SIGINT end it within 5 seconds, SIGHUP reopens its log file.\n"
           "Exit status: 0 ended by a signal, 1 it could not start or run, 2 wrong usage.\n";
}
