// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "lumolib/LastFailure.h"

KestrelTest::KestrelTest() {
    std::string pattern = (std::filesystem::temp_directory_path() / "tovi-kestrel-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) {
        throw std::runtime_error("no temporary directory");
    }
    directory_ = pattern;
    root_ = directory_ + "/root";
    ::setenv("TOVI_ROOT", root_.c_str(), 1);
    ::unsetenv("TOVI_OFFLINE");
    daemon_.emplace(root_);
    daemon_->addContainer(containerId, "gold");
    daemon_->addContainer(otherId, "silver");
    host_.emplace();
}

KestrelTest::~KestrelTest() {
    host_.reset();
    daemon_.reset();
    std::filesystem::remove_all(directory_);
}

FileSystemPointer KestrelTest::mountGold() {
    std::string id = containerId;
    return FileSystemPointer(host_->AddLumoFileSystem("gold", id, {}, true));
}

std::vector<std::string> KestrelTest::namesOfFileSystems() {
    std::vector<std::string> names;
    for (auto *raw : host_->GetLumoFileSystems()) {
        FileSystemPointer const fileSystem(raw);
        names.push_back(fileSystem->GetName());
    }
    return names;
}

std::string KestrelTest::createVolume(Gantry::Storage::LumoFileSystem &fileSystem, std::string const &name) {
    std::string uuid;
    fileSystem.CreateConfigLumo(name, "", 0, "", uuid, "", false);
    return uuid;
}

std::string messageOf(std::function<void()> const &operation) {
    LumoPlatform_ClearLastFailure();
    try {
        operation();
    } catch (Gantry::Lib::GantryException const &exception) {
        LumoLastFailure noted{};
        EXPECT_TRUE(LumoPlatform_LastFailure(&noted));
        EXPECT_EQ(exception.GetMessage(), noted.sentence);
        EXPECT_NE(noted.code, 0);
        return exception.GetMessage();
    }
    return "";
}

void writeFile(std::string const &path, std::string const &text) {
    std::ofstream(path) << text;
}

std::string readFile(std::string const &path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
}

bool exists(std::string const &path) {
    return std::filesystem::symlink_status(path).type() != std::filesystem::file_type::not_found;
}

std::vector<std::string> treeOf(std::string const &path) {
    std::vector<std::string> entries;
    if (exists(path)) {
        for (auto const &entry : std::filesystem::recursive_directory_iterator(path)) {
            entries.push_back(std::filesystem::path(entry.path()).lexically_relative(path).string());
        }
    }
    std::sort(entries.begin(), entries.end());
    return entries;
}
