// SPDX-License-Identifier: Apache-2.0
#include "Fixture.h"

#include <filesystem>
#include <sstream>

#include "Run.h"
#include "orka/conformance/Bugs.h"

namespace {

class OrkasimTest : public OrkaTest {
protected:
    OrkasimTest() {
        writeBytes(at("t.json"), sampleTopology());
    }

    int run(Orkasim::Words const &words, std::string const &input = "") {
        std::istringstream in(input);
        std::ostringstream out;
        std::ostringstream err;
        auto const status = Orkasim::run(words, {in, out, err});
        out_ = out.str();
        err_ = err.str();
        return static_cast<int>(status);
    }

    std::string out_;
    std::string err_;
};

std::string const usage =
    "usage:\n"
    "  orkasim make [--force] TOPOLOGY ARRAYFILE\n"
    "      makes an array file from a topology in JSON (- reads standard input); --force replaces "
    "an array file\n"
    "  orkasim show ARRAYFILE\n"
    "      tells how much an array file holds\n"
    "  orkasim serve [options] ARRAYFILE\n"
    "      serves an array file over HTTPS and prints its URL; SIGTERM ends it\n"
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
    "      --bug NAME             breaks one promise of a provider's; --bug help lists which there are\n";

} // namespace

TEST_F(OrkasimTest, makesAnArrayFileSilently) {
    EXPECT_EQ(run({"make", at("t.json"), at("x.array")}), 0);
    EXPECT_EQ(out_ + err_, "");
    EXPECT_EQ(Orka::ArrayFile(at("x.array")).counts().arrays, 2);
}

TEST_F(OrkasimTest, readsATopologyFromStandardInput) {
    EXPECT_EQ(run({"make", "-", at("x.array")}, sampleTopology()), 0);
    EXPECT_EQ(Orka::ArrayFile(at("x.array")).counts().arrays, 2);
    EXPECT_EQ(run({"make", "-", at("y.array")}, "{"), 1);
    EXPECT_EQ(err_, "orkasim: standard input: line 1, column 2: Missing a name for object member.\n");
}

TEST_F(OrkasimTest, replacesAnArrayFileOnlyByForce) {
    ASSERT_EQ(run({"make", at("t.json"), at("x.array")}), 0);
    EXPECT_EQ(run({"make", "-", at("x.array")}, R"({"arrays": []})"), 1);
    EXPECT_EQ(err_, "orkasim: '" + at("x.array") + "' exists already\n");
    EXPECT_EQ(Orka::ArrayFile(at("x.array")).counts().arrays, 2);
    EXPECT_EQ(run({"make", "--force", "-", at("x.array")}, R"({"arrays": []})"), 0);
    EXPECT_EQ(Orka::ArrayFile(at("x.array")).counts().arrays, 0);
}

TEST_F(OrkasimTest, tellsWhereATopologyIsWrongAndMakesNothing) {
    writeBytes(at("bad.json"), R"({"arrays": [{"id": ""}]})");
    EXPECT_EQ(run({"make", at("bad.json"), at("x.array")}), 1);
    EXPECT_EQ(err_, "orkasim: " + at("bad.json") + ": arrays[0].id: an empty text is not allowed here\n");
    EXPECT_EQ(out_, "");
    EXPECT_EQ(filesInDirectory(), (std::vector<std::string>{"bad.json", "t.json"}));
}

TEST_F(OrkasimTest, tellsWhyATopologyCannotBeRead) {
    EXPECT_EQ(run({"make", at("none.json"), at("x.array")}), 1);
    EXPECT_EQ(err_, "orkasim: the topology '" + at("none.json") + "' cannot be read: No such file or directory\n");
    EXPECT_EQ(run({"make", directory_, at("x.array")}), 1);
    EXPECT_EQ(err_, "orkasim: the topology '" + directory_ + "' cannot be read: Is a directory\n");
    writeBytes(at("empty.json"), "");
    EXPECT_EQ(run({"make", at("empty.json"), at("x.array")}), 1);
    EXPECT_EQ(err_, "orkasim: " + at("empty.json") + ": line 1, column 1: The document is empty.\n");
}

TEST_F(OrkasimTest, refusesATopologyWithoutAnEnd) {
    EXPECT_EQ(run({"make", "/dev/zero", at("x.array")}), 1);
    EXPECT_EQ(err_, "orkasim: the topology '/dev/zero' is larger than the 256 MiB that one may be\n");
    EXPECT_EQ(filesInDirectory(), (std::vector<std::string>{"t.json"}));
}

TEST_F(OrkasimTest, showsWhatAnArrayFileHolds) {
    makeArray("x.array");
    Orka::ArrayFile(at("x.array")).setHostContext("ne\x1bxa");
    EXPECT_EQ(run({"show", at("x.array")}), 0);
    EXPECT_EQ(out_, "Array file:          " + at("x.array") +
                        "\n"
                        "Storage arrays:      2\n"
                        "Protocol endpoints:  6\n"
                        "Storage containers:  2\n"
                        "Config volumes:      2\n"
                        "Data volumes:        1\n"
                        "Bound volumes:       1\n"
                        "Metadata pairs:      3\n"
                        "Host's context:      ne\\x1bxa\n");
    EXPECT_EQ(err_, "");
}

TEST_F(OrkasimTest, showsWhyAFileIsNoArrayFile) {
    EXPECT_EQ(run({"show", at("x.array")}), 1);
    EXPECT_EQ(err_, "orkasim: the array file '" + at("x.array") + "' does not exist\n");
    EXPECT_EQ(run({"show", at("t.json")}), 1);
    EXPECT_EQ(err_,
              "orkasim: the array file '" + at("t.json") + "' is damaged: it does not begin as a database file does\n");
}

TEST_F(OrkasimTest, showsNamesWithControlCharactersHarmlessly) {
    EXPECT_EQ(run({"show", "/no\x1b[2Jsuch\nfile"}), 1);
    EXPECT_EQ(err_, "orkasim: the array file '/no\\x1b[2Jsuch\\x0afile' does not exist\n");
}

TEST_F(OrkasimTest, tellsWhatIsWrongWithTheWords) {
    struct Case {
        Orkasim::Words words;
        char const *sentence;
    };
    for (auto const &[words, sentence] : std::vector<Case>{
             {{}, "a command is missing"},
             {{"serve-me"}, "there is no command 'serve-me'"},
             {{"make"}, "TOPOLOGY is missing"},
             {{"make", "a"}, "ARRAYFILE is missing"},
             {{"make", "a", "b", "c"}, "'c' is one word too many"},
             {{"make", "--fast", "a", "b"}, "there is no option '--fast'"},
             {{"show"}, "ARRAYFILE is missing"},
             {{"show", "--force", "a"}, "there is no option '--force'"},
             {{"serve"}, "ARRAYFILE is missing"},
             {{"serve", "--listen"}, "--listen needs a value"},
             {{"serve", "--listen", "here", "a"}, "--listen is ADDRESS:PORT, not 'here'"},
             {{"serve", "--listen", "*:0", "a"}, "--listen is ADDRESS:PORT, not '*:0'"},
             {{"serve", "--listen", "127.0.0.1:", "a"}, "--listen is ADDRESS:PORT, not '127.0.0.1:'"},
             {{"serve", "--listen", "127.0.0.1:65536", "a"}, "--listen is ADDRESS:PORT, not '127.0.0.1:65536'"},
             {{"serve", "--listen", "unix:1", "a"}, "--listen is ADDRESS:PORT, not 'unix:1'"},
             {{"serve", "--latency=soon", "a"}, "--latency is a whole number from 0 to 3600000, not 'soon'"},
             {{"serve", "--seed=1", "--seed=2", "a"}, "--seed stands there twice"},
             {{"serve", "--cert", "c", "a"}, "--cert and --key go together"},
             {{"serve", "--on", "getMetadata", "a"}, "--on and --times tell when to --misbehave"},
             {{"serve", "--misbehave", "hang", "--on", "getmetadata", "a"},
              "--on is an operation, such as getMetadata, not 'getmetadata'"},
             {{"serve", "--misbehave", "steal", "a"},
              "--misbehave is one of hang, drip, endless, huge, bomb, garbage, truncated, redirect, reset, "
              "unavailable, "
              "not 'steal'"},
             {{"serve", "--bug", "nope", "a"}, "there is no bug 'nope'; 'orkasim serve --bug help' lists them all"},
         }) {
        EXPECT_EQ(run(words), 2);
        EXPECT_EQ(err_, std::string("orkasim: ") + sentence + "\n" + usage);
        EXPECT_EQ(out_, "");
    }
}

TEST_F(OrkasimTest, tellsWhyItCannotListen) {
    makeArray("x.array");
    EXPECT_EQ(run({"serve", "--listen", "192.0.2.1:5", at("x.array")}), 1);
    EXPECT_EQ(err_, "orkasim: cannot listen at 192.0.2.1:5: Cannot assign requested address\n");
}

TEST_F(OrkasimTest, helpsWhenAsked) {
    EXPECT_EQ(run({"--help"}), 0);
    EXPECT_EQ(out_, usage);
    EXPECT_EQ(run({"make", "-h"}), 0);
    EXPECT_EQ(out_, usage);
}

TEST_F(OrkasimTest, listsEveryBugAndWhatBecomesOfIt) {
    EXPECT_EQ(run({"serve", "--bug", "help"}), 0);
    for (auto const &bug : Orka::Conformance::bugs()) {
        auto const entry = std::string(bug.name) + "\n    " + bug.description + '\n';
        EXPECT_NE(out_.find(entry), std::string::npos) << bug.name;
    }
    EXPECT_NE(out_.find("rebinds\n    A volume that is bound is bound to another endpoint instead.\n"
                        "    found by volume/bind/other-endpoint\n"),
              std::string::npos);
    EXPECT_NE(out_.find("    hidden here: the client takes no more than it asked for\n"), std::string::npos);
}

TEST_F(OrkasimTest, takesAWordAfterTheDashesAsAName) {
    auto const path = std::filesystem::relative(at("x.array"));
    EXPECT_EQ(run({"make", "--", at("t.json"), path}), 0);
    EXPECT_EQ(run({"show", "--", "--help"}), 1);
    EXPECT_EQ(err_, "orkasim: the array file '--help' does not exist\n");
}

TEST_F(OrkasimTest, saysWhenTheOutputCannotBeWritten) {
    makeArray("x.array");
    std::istringstream in;
    std::ostringstream out;
    std::ostringstream err;
    out.setstate(std::ios::badbit);
    EXPECT_EQ(static_cast<int>(Orkasim::run({"show", at("x.array")}, {in, out, err})), 4);
    EXPECT_EQ(err.str(), "orkasim: the output could not be written\n");
}
