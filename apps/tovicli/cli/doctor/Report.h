// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace Tovicli::Cli {

enum class State { Ok, Warn, Fail };

/// One line of `cli doctor`: what was looked at, how it is, and why.
struct Check {
    std::string name;
    State state = State::Ok;
    std::string detail;
};

/// What was found so far, in the order in which it was looked at.
class Report {
public:
    void ok(std::string name, std::string detail) {
        checks_.push_back({std::move(name), State::Ok, std::move(detail)});
    }
    /// Works, but somebody should know.
    void warn(std::string name, std::string detail) {
        checks_.push_back({std::move(name), State::Warn, std::move(detail)});
    }
    void fail(std::string name, std::string detail) {
        checks_.push_back({std::move(name), State::Fail, std::move(detail)});
    }
    std::vector<Check> const &checks() const {
        return checks_;
    }

private:
    std::vector<Check> checks_;
};

} // namespace Tovicli::Cli
