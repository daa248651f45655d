// SPDX-License-Identifier: Apache-2.0
#include "Trace.h"

#include <utility>

#include "plexa/JsonText.h"

namespace Tovicli {

namespace {

std::chrono::microseconds processClock() {
    return std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now().time_since_epoch());
}

/// "12.034"
std::string milliseconds(std::chrono::microseconds duration) {
    std::string const fraction = std::to_string(duration.count() % 1000);
    return std::to_string(duration.count() / 1000) + "." + std::string(3 - fraction.size(), '0') + fraction;
}

} // namespace

Trace::Trace(Plexa::Sink &sink, Clock clock)
    : sink_(sink)
    , clock_(clock ? std::move(clock) : Clock(processClock))
    , began_(clock_()) {}

void Trace::setEnabled(bool enabled) {
    enabled_ = enabled;
    if (!enabled && held_) {
        held_->clear();
    }
}

void Trace::hold() {
    held_.emplace();
}

void Trace::release() {
    if (held_ && !held_->empty()) {
        sink_.write(*held_);
    }
    held_.reset();
}

void Trace::write(std::string const &line) {
    if (held_) {
        *held_ += line;
    } else {
        sink_.write(line);
    }
}

std::chrono::microseconds Trace::elapsed() const {
    return clock_() - began_;
}

Trace::Event::Event(Trace &trace, char const *name)
    : trace_(trace) {
    if (trace_.enabled_) {
        line_ = "tovicli: trace: " + milliseconds(trace_.elapsed()) + " " + name;
    }
}

Trace::Event::~Event() {
    if (!line_.empty()) {
        trace_.write(line_ + "\n");
    }
}

Trace::Event &Trace::Event::text(char const *key, std::string_view value) {
    if (!line_.empty()) {
        line_ += std::string(" ") + key + "=" + Plexa::jsonText(value);
    }
    return *this;
}

Trace::Event &Trace::Event::number(char const *key, int64_t value) {
    if (!line_.empty()) {
        line_ += std::string(" ") + key + "=" + std::to_string(value);
    }
    return *this;
}

Trace::Event &Trace::Event::duration(char const *key, std::chrono::microseconds value) {
    if (!line_.empty()) {
        line_ += std::string(" ") + key + "=" + milliseconds(value);
    }
    return *this;
}

} // namespace Tovicli
