// SPDX-License-Identifier: Apache-2.0
//
//   manual pages LIBRARIES PLUGIN CLI DIRECTORY      writes tovicli.1 and a page for each command into the directory
//   manual help PROGRAM SECTION SUMMARY FILE         writes a page made of what stands on standard input
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <vector>

#include "Pages.h"

namespace {

using namespace Tovicli::Manual;

void writePage(std::filesystem::path const &path, std::string const &page) {
    std::filesystem::create_directories(path.parent_path());
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    if (!(file << page).flush()) {
        throw std::runtime_error("cannot write " + path.string());
    }
}

void writePages(std::vector<std::string> const &words) {
    std::filesystem::path const directory = words[5];
    if (std::filesystem::exists(directory)) { // pages of commands that are no more
        for (auto const &entry : std::filesystem::directory_iterator(directory)) {
            if (entry.path().filename().string().starts_with("tovicli-")) {
                std::filesystem::remove(entry.path());
            }
        }
    }
    DeclaredTree const tree({words[2], words[3], words[4]});
    for (auto const &command : tree.commands()) {
        writePage(directory / (pageName(*command) + ".1"),
                  commandPage(*command, command->GetParent()->GetNamespaceNodes(), TOVI_VERSION));
    }
    writePage(directory / "tovicli.1", toolPage(tree, TOVI_VERSION));
}

void writeHelpPage(std::vector<std::string> const &words) {
    std::string const help{std::istreambuf_iterator<char>(std::cin), std::istreambuf_iterator<char>()};
    if (help.empty()) {
        throw std::runtime_error(words[2] + " has no help");
    }
    writePage(words[5], helpPage(words[2], std::stoi(words[3]), words[4], help, TOVI_VERSION));
}

} // namespace

int main(int argc, char **argv) {
    std::vector<std::string> const words(argv, argv + argc);
    try {
        if (words.size() == 6 && words[1] == "pages") {
            writePages(words);
        } else if (words.size() == 6 && words[1] == "help") {
            writeHelpPage(words);
        } else {
            throw std::runtime_error("usage: manual pages LIBRARIES PLUGIN CLI DIRECTORY\n"
                                     "       manual help PROGRAM SECTION SUMMARY FILE < HELP");
        }
        return 0;
    } catch (std::exception const &failure) {
        std::cerr << "manual: " << failure.what() << '\n';
        return 1;
    }
}
