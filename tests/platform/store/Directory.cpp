// SPDX-License-Identifier: Apache-2.0
#include "store/Directory.h"

#include <filesystem>
#include <fstream>

#include <sys/stat.h>
#include <unistd.h>

#include "Fixture.h"

namespace {

namespace fs = std::filesystem;

class DirectoryTest : public StoreTest {
protected:
    /// The failure of making a directory, "none" when it is made; with its code in front.
    static std::string made(std::string const &path) {
        auto const failure = failureOf([&] { Store::makeDirectoryDurably(path); });
        return failure ? std::to_string(static_cast<int>(failure->code())) + ": " + failure->sentence() : "none";
    }
    static std::string told(Wire::ErrorCode code, std::string const &path, std::string const &why) {
        return std::to_string(static_cast<int>(code)) + ": the directory '" + path + "' cannot be made: " + why;
    }
};

TEST_F(DirectoryTest, IsMadeWithWhatIsAboveItAndMayBeThere) {
    EXPECT_EQ(made(directory_ + "/a/b/c/"), "none");
    EXPECT_EQ(made(directory_ + "/a/b/c"), "none");
    EXPECT_TRUE(fs::is_directory(directory_ + "/a/b/c"));
    EXPECT_EQ(made("/"), "none");
    fs::path const before = fs::current_path();
    fs::current_path(directory_);
    EXPECT_EQ(made("relative"), "none");
    fs::current_path(before);
    EXPECT_TRUE(fs::is_directory(directory_ + "/relative"));
}

TEST_F(DirectoryTest, SaysWhyItCannotBeMade) {
    std::ofstream(directory_ + "/file") << "x";
    fs::create_symlink(directory_ + "/nowhere", directory_ + "/link");
    for (std::string const name : {"/file", "/link"}) {
        EXPECT_EQ(made(directory_ + name), told(Wire::ErrorCode::IoError, directory_ + name, "Not a directory"));
    }
    EXPECT_EQ(made(directory_ + "/file/under"),
              told(Wire::ErrorCode::IoError, directory_ + "/file/under", "Not a directory"));
    EXPECT_EQ(made(""), told(Wire::ErrorCode::IoError, "", "No such file or directory"));
    EXPECT_EQ(made("/proc/none"), told(Wire::ErrorCode::IoError, "/proc/none", "No such file or directory"));
}

TEST_F(DirectoryTest, NeedsNoRightToReadWhatIsAboveIt) {
    std::string const open = directory_ + "/open";
    std::string const closed = directory_ + "/closed";
    fs::create_directory(open);
    fs::create_directory(closed);
    ASSERT_EQ(::chmod(directory_.c_str(), 0711), 0);
    ASSERT_EQ(::chmod(open.c_str(), 0333), 0); // to be entered and written, not read
    ASSERT_EQ(::chmod(closed.c_str(), 0555), 0);
    // Root may do everything; become somebody else for a while.
    bool const root = ::geteuid() == 0;
    ASSERT_TRUE(!root || ::seteuid(65534) == 0);
    std::string const first = made(open + "/made");
    std::string const second = made(closed + "/made");
    ASSERT_TRUE(!root || ::seteuid(0) == 0);
    EXPECT_EQ(first, "none");
    EXPECT_EQ(second, told(Wire::ErrorCode::FileReadOnly, closed + "/made", "Permission denied"));
    ASSERT_EQ(::chmod(open.c_str(), 0755), 0);
    EXPECT_TRUE(fs::is_directory(open + "/made"));
}

} // namespace
