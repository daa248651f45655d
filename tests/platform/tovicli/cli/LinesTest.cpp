// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <fcntl.h>
#include <unistd.h>

#include "Descriptor.h"
#include "TemporaryDirectory.h"
#include "shell/LineSource.h"

namespace {

using namespace Tovicli::Cli;

class Lines : public ::testing::Test {
protected:
    void give(std::string const &content) {
        writeFile(directory / "input", content);
        input = Tovicli::Descriptor(open((directory / "input").c_str(), O_RDONLY | O_CLOEXEC));
        lines = plainLines(input.number(), {});
    }
    void expect(Line::Kind kind, std::string const &text = {}) {
        Line const line = lines->next();
        EXPECT_EQ(line.kind, kind);
        EXPECT_EQ(line.text, text);
    }

    TemporaryDirectory directory;
    Tovicli::Descriptor input;
    std::unique_ptr<LineSource> lines;
};

TEST_F(Lines, ComeOneByOneWithoutTheirEnds) {
    give("a\n\nb c\r\n");
    expect(Line::Kind::Text, "a");
    expect(Line::Kind::Text, "");
    expect(Line::Kind::Text, "b c");
    expect(Line::Kind::End);
    expect(Line::Kind::End);
}

TEST_F(Lines, TheLastOneNeedsNoEnd) {
    give("a\nb");
    expect(Line::Kind::Text, "a");
    expect(Line::Kind::Text, "b");
    expect(Line::Kind::End);
}

TEST_F(Lines, OneThatIsTooLongIsToldAndTheNextOneWorks) {
    give(std::string(3 << 20, 'x') + "\nb\n");
    expect(Line::Kind::TooLong);
    expect(Line::Kind::Text, "b");
    expect(Line::Kind::End);
}

} // namespace
