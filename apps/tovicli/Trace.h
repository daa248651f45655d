// SPDX-License-Identifier: Apache-2.0
//
// What a run does, step by step, for a user who asks for everything (--log-level trivia). One line an event on standard
// error, so that standard output stays what it is:
//
//   tovicli: trace: <milliseconds since the run began> <event> <key>=<value>...
//
// Numbers are plain; durations are in milliseconds with three decimals and their keys end in "Ms"; texts are JSON
// texts. Events: run, plugin, registered, parsed, call, command, output, end.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "plexa/Sink.h"

namespace Tovicli {

class Trace {
public:
    using Clock = std::function<std::chrono::microseconds()>;

    /// @param clock time that passes; null: the process's own
    Trace(Plexa::Sink &sink, Clock clock);

    /// Events that are held back are dropped with it.
    void setEnabled(bool enabled);
    /// Keeps events back until it is certain that they are wanted.
    void hold();
    /// Writes what was held back.
    void release();
    bool isEnabled() const {
        return enabled_;
    }
    /// Since the run began.
    std::chrono::microseconds elapsed() const;

    /// An event on its way: it is written when it goes out of scope. Costs nothing while nobody asked for it.
    class Event {
    public:
        Event(Trace &trace, char const *name);
        ~Event();
        Event(Event const &) = delete;
        Event &operator=(Event const &) = delete;

        Event &text(char const *key, std::string_view value);
        Event &number(char const *key, int64_t value);
        Event &duration(char const *key, std::chrono::microseconds value);

    private:
        Trace &trace_;
        std::string line_;
    };

private:
    void write(std::string const &line);

    Plexa::Sink &sink_;
    std::optional<std::string> held_;
    Clock clock_;
    std::chrono::microseconds began_;
    bool enabled_ = false;
};

} // namespace Tovicli
