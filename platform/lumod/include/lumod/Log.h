// SPDX-License-Identifier: Apache-2.0
//
// The daemon's log. One line an event: time, level, trace id, text. The trace id names the command that caused the
// event, "-" when none did, so that one grep shows what a command set off. Bytes that could confuse a terminal or fake
// a line are written as \xNN.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace Lumod {

/// The numbers are the ones that a debug command sends; a line is written when its number is at most the level's.
/// Quiet is below everything that is ever logged.
enum class LogLevel : int32_t { Quiet = 1, Panic = 2, Error = 4, Warning = 8, Info = 16, Verbose = 32, Trivia = 64 };

/// @return nothing for a number that is no level
std::optional<LogLevel> logLevelOf(int64_t number);
/// @param word a level's name in lower case
std::optional<LogLevel> logLevelNamed(std::string_view word);
char const *nameOf(LogLevel level);

/// Where lines go: each one is whole and ends in a newline.
class LogSink {
public:
    virtual ~LogSink() = default;
    virtual void write(std::string_view line) = 0;
    /// After the file was moved away: goes on in a new one of the same name.
    virtual void reopen() {}
};

/// Appends to a file that it makes with mode 0640. A line that cannot be written is lost; the daemon goes on.
/// @throws Wire::Failure IoError, naming the path, when the file cannot be opened
std::unique_ptr<LogSink> openLogFile(std::string const &path);

class Log {
public:
    using WallClock = std::function<std::chrono::system_clock::time_point()>;

    Log(
        LogSink &sink, LogLevel level, WallClock wallClock = [] { return std::chrono::system_clock::now(); });

    LogLevel level() const {
        return level_;
    }
    void setLevel(LogLevel level) {
        level_ = level;
    }
    bool shows(LogLevel level) const {
        return static_cast<int32_t>(level) <= static_cast<int32_t>(level_);
    }

    void write(LogLevel level, std::string_view trace, std::string_view text);
    /// Writes whatever the level: what a user has asked for expressly.
    void writeAlways(std::string_view trace, std::string_view text);
    /// As writeAlways, for a text that is printable ASCII already and reads better unescaped.
    void writeRaw(std::string_view trace, std::string_view text);
    void reopen() {
        sink_.reopen();
    }

private:
    void writeLine(char const *level, std::string_view trace, std::string const &text);

    LogSink &sink_;
    LogLevel level_;
    WallClock wallClock_;
};

} // namespace Lumod
