// SPDX-License-Identifier: Apache-2.0
#include "lumod/Log.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <ctime>
#include <utility>

#include <fcntl.h>
#include <unistd.h>

#include <fmt/format.h>

#include "Escape.h"
#include "wire/Failure.h"

namespace Lumod {

namespace {

struct NamedLevel {
    LogLevel level;
    char const *name;
};

constexpr std::array<NamedLevel, 7> levels{{{LogLevel::Quiet, "quiet"},
                                            {LogLevel::Panic, "panic"},
                                            {LogLevel::Error, "error"},
                                            {LogLevel::Warning, "warning"},
                                            {LogLevel::Info, "info"},
                                            {LogLevel::Verbose, "verbose"},
                                            {LogLevel::Trivia, "trivia"}}};

/// A client chooses the trace id; it must not make lines as long as it likes.
constexpr std::size_t traceBytesMax = 128;

class FileSink : public LogSink {
public:
    explicit FileSink(std::string path)
        : path_(std::move(path))
        , descriptor_(open()) {
        if (descriptor_ < 0) {
            throw Wire::Failure(Wire::ErrorCode::IoError,
                                fmt::format("cannot open the log file {}: {}", path_, std::strerror(errno)));
        }
    }
    ~FileSink() override {
        ::close(descriptor_);
    }
    FileSink(FileSink const &) = delete;
    FileSink &operator=(FileSink const &) = delete;

    void write(std::string_view line) override {
        while (!line.empty()) {
            ssize_t const written = ::write(descriptor_, line.data(), line.size());
            if (written < 0 && errno == EINTR) {
                continue;
            }
            if (written <= 0) {
                return;
            }
            line.remove_prefix(static_cast<std::size_t>(written));
        }
    }

    void reopen() override {
        int const next = open();
        if (next >= 0) {
            ::close(std::exchange(descriptor_, next));
        }
    }

private:
    int open() const {
        return ::open(path_.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0640);
    }

    std::string path_;
    int descriptor_;
};

std::string timestamp(std::chrono::system_clock::time_point moment) {
    auto const sinceEpoch = std::chrono::duration_cast<std::chrono::milliseconds>(moment.time_since_epoch()).count();
    auto const seconds = static_cast<std::time_t>(sinceEpoch / 1000);
    std::tm parts{};
    ::gmtime_r(&seconds, &parts);
    return fmt::format("{:04}-{:02}-{:02}T{:02}:{:02}:{:02}.{:03}Z", parts.tm_year + 1900, parts.tm_mon + 1,
                       parts.tm_mday, parts.tm_hour, parts.tm_min, parts.tm_sec, sinceEpoch % 1000);
}

} // namespace

std::optional<LogLevel> logLevelOf(int64_t number) {
    for (NamedLevel const &known : levels) {
        if (static_cast<int32_t>(known.level) == number) {
            return known.level;
        }
    }
    return std::nullopt;
}

std::optional<LogLevel> logLevelNamed(std::string_view word) {
    for (NamedLevel const &known : levels) {
        if (known.name == word) {
            return known.level;
        }
    }
    return std::nullopt;
}

char const *nameOf(LogLevel level) {
    for (NamedLevel const &known : levels) {
        if (known.level == level) {
            return known.name;
        }
    }
    return "unknown";
}

std::unique_ptr<LogSink> openLogFile(std::string const &path) {
    return std::make_unique<FileSink>(path);
}

Log::Log(LogSink &sink, LogLevel level, WallClock wallClock)
    : sink_(sink)
    , level_(level)
    , wallClock_(std::move(wallClock)) {}

void Log::write(LogLevel level, std::string_view trace, std::string_view text) {
    if (shows(level)) {
        writeLine(nameOf(level), trace, escaped(text));
    }
}

void Log::writeAlways(std::string_view trace, std::string_view text) {
    writeLine(nameOf(LogLevel::Info), trace, escaped(text));
}

void Log::writeRaw(std::string_view trace, std::string_view text) {
    writeLine(nameOf(LogLevel::Info), trace, std::string(text));
}

void Log::writeLine(char const *level, std::string_view trace, std::string const &text) {
    std::string const id = trace.empty() ? "-" : escaped(trace.substr(0, traceBytesMax));
    sink_.write(fmt::format("{} {} {} {}\n", timestamp(wallClock_()), level, id, text));
}

} // namespace Lumod
