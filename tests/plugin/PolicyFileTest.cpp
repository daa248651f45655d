// SPDX-License-Identifier: Apache-2.0
//
// The one file that a command reads: a config volume's policy.
#include <cstdlib>
#include <filesystem>
#include <fstream>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "CommandTest.h"
#include "ConfigLumoAdd.h"

using namespace PluginTest;
using TarselCli::LumoNamespace::ConfigLumoAdd;

namespace {

constexpr std::size_t longestPolicy = std::size_t{64} * 1024;

class PolicyFile : public CommandTest {
protected:
    PolicyFile() {
        std::string pattern = (std::filesystem::temp_directory_path() / "policy-XXXXXX").string();
        if (mkdtemp(pattern.data()) == nullptr) {
            throw std::runtime_error("no temporary directory");
        }
        directory_ = pattern;
    }
    ~PolicyFile() override {
        std::filesystem::remove_all(directory_);
    }
    std::string fileOf(std::string const &content) const {
        std::string const path = (directory_ / "policy").string();
        std::ofstream(path, std::ios::binary) << content;
        return path;
    }
    /// Creates a volume with this policy file; the policy that reached the host.
    std::string policyFrom(std::string const &path) {
        FileSystemScript gold("gold");
        gold.hasContainerId.always(true);
        kestrel.getLumoFileSystems.once({gold});
        renewCall();
        input->SetString("name", "n");
        input->SetString("policy-file", path);
        input->SetString("policy", "not consulted");
        run<ConfigLumoAdd>();
        expectResultAlone("true");
        EXPECT_THAT(callsOf("Input.HasParameter(\"policy\")"), IsEmpty());
        EXPECT_THAT(callsOf("Input.GetString(\"policy\")"), IsEmpty());
        std::string const line = callsOf("fs(gold).Create").at(0);
        std::string const head = "fs(gold).CreateConfigLumo(\"n\", ";
        std::string const tail = ", 0, \"\", \"\", \"\", false)";
        EXPECT_EQ(line.substr(0, head.size()), head);
        EXPECT_EQ(line.substr(line.size() - tail.size()), tail);
        return line.substr(head.size(), line.size() - head.size() - tail.size());
    }
    std::filesystem::path directory_;
};

TEST_F(PolicyFile, GivesItsFirstLineWithoutTheNewline) {
    EXPECT_EQ(policyFrom(fileOf("thin;fast\nsecond\nthird\n")), "\"thin;fast\"");
}

TEST_F(PolicyFile, WithAnEmptyFirstLineGivesAnEmptyPolicy) {
    EXPECT_EQ(policyFrom(fileOf("\nsecond\n")), "\"\"");
}

TEST_F(PolicyFile, ThatIsEmptyGivesAnEmptyPolicy) {
    EXPECT_EQ(policyFrom(fileOf("")), "\"\"");
}

TEST_F(PolicyFile, WithoutANewlineGivesItsWholeContent) {
    EXPECT_EQ(policyFrom(fileOf("  thin \r")), "\"  thin \r\"");
}

TEST_F(PolicyFile, ThatIsMissingGivesAnEmptyPolicy) {
    EXPECT_EQ(policyFrom((directory_ / "missing").string()), "\"\"");
    EXPECT_EQ(policyFrom(""), "\"\"");
}

TEST_F(PolicyFile, ThatIsADirectoryGivesAnEmptyPolicy) {
    EXPECT_EQ(policyFrom(directory_.string()), "\"\"");
}

TEST_F(PolicyFile, ThatMayNotBeOpenedGivesAnEmptyPolicy) {
    std::string const path = fileOf("secret\n");
    std::filesystem::permissions(path, std::filesystem::perms::none);
    if (access(path.c_str(), R_OK) == 0) {
        GTEST_SKIP() << "this user may read everything";
    }
    EXPECT_EQ(policyFrom(path), "\"\"");
}

TEST_F(PolicyFile, ThatFailsToBeReadGivesAnEmptyPolicy) {
    // Opens, but nothing is mapped at its beginning, so that reading is an input error for every user.
    EXPECT_EQ(policyFrom("/proc/self/mem"), "\"\"");
}

TEST_F(PolicyFile, MayHaveAFirstLineOf64KiB) {
    std::string const line(longestPolicy, 'p');
    EXPECT_EQ(policyFrom(fileOf(line)), "\"" + line + "\"");
    EXPECT_EQ(policyFrom(fileOf(line + "\nmore")), "\"" + line + "\"");
}

TEST_F(PolicyFile, WithALongerFirstLineGivesAnEmptyPolicy) {
    std::string const line(longestPolicy + 1, 'p');
    EXPECT_EQ(policyFrom(fileOf(line)), "\"\"");
    EXPECT_EQ(policyFrom(fileOf(line + "\n")), "\"\"");
}

TEST_F(PolicyFile, ThatNeverEndsGivesAnEmptyPolicy) {
    EXPECT_EQ(policyFrom("/dev/zero"), "\"\"");
}

TEST_F(PolicyFile, MayBeAPipeThatStaysOpenBehindTheFirstLine) {
    std::string const path = (directory_ / "pipe").string();
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    int const pipe = open(path.c_str(), O_RDWR | O_CLOEXEC);
    ASSERT_GE(pipe, 0);
    ASSERT_EQ(write(pipe, "thin\n", 5), 5);
    EXPECT_EQ(policyFrom(path), "\"thin\"");
    close(pipe);
}

class PolicyText : public CommandTest {};

TEST_F(PolicyText, IsTakenWhenNoFileIsNamed) {
    FileSystemScript gold("gold");
    gold.hasContainerId.always(true);
    kestrel.getLumoFileSystems.once({gold});
    input->SetString("policy", "first\nsecond");
    run<ConfigLumoAdd>();
    EXPECT_THAT(callsOf("fs(gold).Create"),
                ElementsAre("fs(gold).CreateConfigLumo(\"\", \"first\\nsecond\", 0, \"\", \"\", \"\", false)"));
}

} // namespace
