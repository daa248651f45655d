// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <optional>
#include <string>

namespace Tovicli {

/// The process's environment, or a test's stand-in for it.
class Environment {
public:
    virtual ~Environment() = default;
    virtual std::optional<std::string> get(std::string const &name) const = 0;
    virtual void set(std::string const &name, std::string const &value) = 0;
    virtual void unset(std::string const &name) = 0;
};

class ProcessEnvironment : public Environment {
public:
    std::optional<std::string> get(std::string const &name) const override;
    void set(std::string const &name, std::string const &value) override;
    void unset(std::string const &name) override;
};

/// Keeps what is set: the twin for tests.
class MapEnvironment : public Environment {
public:
    std::optional<std::string> get(std::string const &name) const override {
        auto const found = values.find(name);
        return found != values.end() ? std::optional(found->second) : std::nullopt;
    }
    void set(std::string const &name, std::string const &value) override {
        values[name] = value;
    }
    void unset(std::string const &name) override {
        values.erase(name);
    }

    std::map<std::string, std::string> values;
};

} // namespace Tovicli
