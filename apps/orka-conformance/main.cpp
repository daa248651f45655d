// SPDX-License-Identifier: Apache-2.0
#include <csignal>
#include <exception>
#include <fstream>
#include <iostream>

#include <kj/exception.h>

#include "Reports.h"
#include "Run.h"
#include "orka/conformance/Printable.h"
#include "wire/Failure.h"

using namespace OrkaConformance;

namespace {

ExitStatus act(Options const &options, std::ostream &out) {
    switch (options.action) {
    case Action::Help:
        out << usageText();
        return ExitStatus::AllPassed;
    case Action::ListCases:
        out << caseList(options.format);
        return ExitStatus::AllPassed;
    case Action::ListBugs:
        out << bugList(options.format);
        return ExitStatus::AllPassed;
    case Action::Run:
        break;
    }
    return run(options, out, std::cerr);
}

ExitStatus actAndClose(Options const &options) {
    std::ofstream file;
    if (!options.outputPath.empty()) {
        file.open(options.outputPath, std::ios::binary | std::ios::trunc);
        if (!file) {
            std::cerr << "orka-conformance: '" << Orka::Conformance::printable(options.outputPath)
                      << "' cannot be written\n";
            return ExitStatus::OutputFailed;
        }
    }
    std::ostream &out = options.outputPath.empty() ? std::cout : file;
    auto const status = act(options, out);
    if (!out.flush()) {
        std::cerr << "orka-conformance: the result could not be written\n";
        return ExitStatus::OutputFailed;
    }
    return status;
}

} // namespace

int main(int argc, char **argv) {
    std::vector<std::string> words(argv + (argc > 0 ? 1 : 0), argv + argc);
    // A reader that goes away is a result that could not be written, not a death in the middle of a case.
    std::signal(SIGPIPE, SIG_IGN);
    try {
        if (!words.empty() && words.front() == "--victim") {
            return runVictim({words.begin() + 1, words.end()});
        }
        return static_cast<int>(actAndClose(parseOptions(words)));
    } catch (UsageError const &error) {
        std::cerr << "orka-conformance: " << Orka::Conformance::printable(error.what()) << '\n' << usageText();
        return static_cast<int>(ExitStatus::Usage);
    } catch (Wire::Failure const &failure) {
        std::cerr << "orka-conformance: " << Orka::Conformance::printable(failure.sentence()) << '\n';
    } catch (std::exception const &error) {
        std::cerr << "orka-conformance: " << Orka::Conformance::printable(error.what()) << '\n';
    } catch (kj::Exception const &error) {
        std::cerr << "orka-conformance: " << Orka::Conformance::printable(error.getDescription().cStr()) << '\n';
    }
    return static_cast<int>(ExitStatus::SomeFailed);
}
