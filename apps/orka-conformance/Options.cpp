// SPDX-License-Identifier: Apache-2.0
#include "Options.h"

#include <algorithm>
#include <charconv>
#include <functional>
#include <map>

#include <fnmatch.h>

namespace OrkaConformance {

namespace {

Format formatOf(std::string const &word) {
    static std::map<std::string, Format> const formats{
        {"text", Format::Text}, {"json", Format::Json}, {"junit", Format::Junit}, {"markdown", Format::Markdown}};
    auto const found = formats.find(word);
    if (found == formats.end()) {
        throw UsageError("--format takes text, json, junit or markdown, not '" + word + "'");
    }
    return found->second;
}

uint64_t seedOf(std::string const &word) {
    uint64_t seed = 0;
    auto const [end, error] = std::from_chars(word.data(), word.data() + word.size(), seed);
    if (word.empty() || error != std::errc() || end != word.data() + word.size()) {
        throw UsageError("--seed takes a whole number of 64 bits, not '" + word + "'");
    }
    return seed;
}

/// As the command-line tool takes it: seconds, or a number with "ms" or "s" behind it.
int64_t timeoutOf(std::string const &word) {
    auto const unit = word.find_first_not_of("0123456789");
    bool const isMs = unit != std::string::npos && word.substr(unit) == "ms";
    bool const isKnown = unit == std::string::npos || isMs || word.substr(unit) == "s";
    int64_t number = 0;
    auto const [end, error] = std::from_chars(word.data(), word.data() + std::min(unit, word.size()), number);
    int64_t const longest = isMs ? 3600000 : 3600;
    if (!isKnown || error != std::errc() || number < 1 || number > longest) {
        throw UsageError("--timeout takes seconds, or milliseconds as in 500ms, up to an hour, not '" + word + "'");
    }
    return isMs ? number : number * 1000;
}

using Setter = std::function<void(Options &, std::string const &)>;

std::map<std::string, Setter> const &settersWithValue() {
    static std::map<std::string, Setter> const setters{
        {"--format", [](Options &options, std::string const &word) { options.format = formatOf(word); }},
        {"--output", [](Options &options, std::string const &word) { options.outputPath = word; }},
        {"--only", [](Options &options, std::string const &word) { options.only.push_back(word); }},
        {"--seed", [](Options &options, std::string const &word) { options.seed = seedOf(word); }},
        {"--timeout", [](Options &options, std::string const &word) { options.timeoutMs = timeoutOf(word); }},
        {"--certs", [](Options &options, std::string const &word) { options.certificates = word; }},
        {"--bug", [](Options &options, std::string const &word) { options.bug = word; }},
    };
    return setters;
}

std::map<std::string, Action> const &actions() {
    static std::map<std::string, Action> const all{{"--list", Action::ListCases},
                                                   {"--list-bugs", Action::ListBugs},
                                                   {"--help", Action::Help},
                                                   {"-h", Action::Help}};
    return all;
}

void takeUrl(Options &options, std::string const &word) {
    if (!options.url.empty()) {
        throw UsageError("'" + word + "' is one word too many");
    }
    options.url = word;
}

void checkWhole(Options const &options) {
    if (options.action == Action::Run && options.url.empty()) {
        throw UsageError("the provider's URL is missing");
    }
    if (options.action == Action::Run && options.format == Format::Markdown) {
        throw UsageError("--format markdown is for --list and --list-bugs");
    }
    if (options.action != Action::Run && options.format != Format::Text && options.format != Format::Markdown) {
        throw UsageError("a list has the formats text and markdown");
    }
}

} // namespace

Options parseOptions(std::vector<std::string> const &words) {
    Options options;
    bool optionsEnded = false;
    for (size_t index = 0; index < words.size(); ++index) {
        auto const &word = words[index];
        auto const equals = word.find('=');
        auto const name = word.substr(0, equals);
        if (optionsEnded || word.size() < 2 || word.front() != '-') {
            takeUrl(options, word);
        } else if (word == "--") {
            optionsEnded = true;
        } else if (auto const action = actions().find(word); action != actions().end()) {
            options.action = action->second;
        } else if (auto const setter = settersWithValue().find(name); setter == settersWithValue().end()) {
            throw UsageError("there is no option '" + name + "'");
        } else if (equals != std::string::npos) {
            setter->second(options, word.substr(equals + 1));
        } else if (index + 1 < words.size()) {
            setter->second(options, words[++index]);
        } else {
            throw UsageError(name + " needs a value");
        }
    }
    checkWhole(options);
    return options;
}

bool isChosen(Options const &options, std::string const &name) {
    return options.only.empty() ||
           std::any_of(options.only.begin(), options.only.end(),
                       [&](std::string const &pattern) { return fnmatch(pattern.c_str(), name.c_str(), 0) == 0; });
}

char const *usageText() {
    return "usage: orka-conformance [options] URL\n"
           "       orka-conformance --list | --list-bugs\n"
           "\n"
           "Tries whether the provider at URL keeps what its interface promises. It makes volumes of its own in one or "
           "two\n"
           "storage containers and removes them again; beside it the array should be quiet.\n"
           "\n"
           "  --only PATTERN    runs the cases whose names match, as in 'volume/create/*'; may be repeated\n"
           "  --format FORMAT   text (default), json or junit; lists also markdown\n"
           "  --output FILE     writes the result there, not to standard output\n"
           "  --timeout TIME    what each operation is given: 10 or 10s (default), 500ms\n"
           "  --seed N          decides moments and orders that cases leave open; default 1\n"
           "  --certs DIR       trusts the certificate DIR/HOST_PORT.pem of that provider, and no other\n"
           "  --bug NAME        puts a bug between the kit and the provider, to see it found\n"
           "  --list            tells every case and what it demands\n"
           "  --list-bugs       tells every bug and the case that finds it\n"
           "\n"
           "Exit status: 0 every case passed, or was skipped because the array has nothing to try it on; 1 some "
           "failed, or\n"
           "something could not be removed; 2 usage; 3 the provider cannot be reached; 4 the result could not be "
           "written;\n"
           "130 interrupted.\n";
}

} // namespace OrkaConformance
