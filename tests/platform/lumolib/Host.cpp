// SPDX-License-Identifier: Apache-2.0
#include "Host.h"

#include <cstdlib>
#include <filesystem>

#include "lumolib/LastFailure.h"

namespace LumoTest {

namespace {

std::string freshDirectory() {
    std::string name = (std::filesystem::temp_directory_path() / "tovi-lumolib-XXXXXX").string();
    if (mkdtemp(name.data()) == nullptr) {
        throw std::runtime_error("no temporary directory");
    }
    std::filesystem::create_directory(name + "/run");
    return name;
}

} // namespace

Host::Host()
    : paths_(freshDirectory()) {
    set("TOVI_ROOT", paths_.root());
    set("TOVI_TIMEOUT_MS", "20000");
    unsetenv("TOVI_OFFLINE");
    unsetenv("TOVI_REQUEST_ID");
    LumoPlatform_ClearLastFailure();
}

Host::~Host() {
    for (int open = 0; open < 10; ++open) {
        LumoLib_Exit();
    }
    std::filesystem::remove_all(paths_.root());
}

void Host::set(char const *variable, std::string const &value) {
    setenv(variable, value.c_str(), 1);
}

std::string lastFailure() {
    LumoLastFailure failure{};
    if (!LumoPlatform_LastFailure(&failure)) {
        return "none";
    }
    return std::to_string(failure.code) + ": " + failure.sentence;
}

} // namespace LumoTest
