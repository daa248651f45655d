// SPDX-License-Identifier: Apache-2.0
//
// From words to values: the parser of options, driven by declarations.
//
// A parser reads options for one or more groups, each a declaration and the Input that its values go to. A command's
// own parameters are the first group, the tool's global options the second: the first group that declares a name has
// it. The word after an option that takes a value is its value, whatever it looks like.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/CallSpec.h"

namespace Plexa {

class OptionParser {
public:
    struct Group {
        boost::shared_ptr<CallSpec::InputSpec> spec;
        boost::shared_ptr<CallSpec::Input> input;
    };

    explicit OptionParser(std::vector<Group> groups);

    /// Whether a word is written like an option.
    static bool looksLikeOption(std::string const &word);

    /// Names that an unknown option is compared with too: those of another parser that reads the same words.
    void alsoSuggest(OptionParser const &other);

    /// Whether one of the groups declares the option that the word names.
    bool knows(std::string const &word) const;

    /// Reads the option at a position and moves the position past it and its value.
    /// @throws UsageError for an unknown option, a missing, bad or unexpected value, a scalar given twice.
    void take(std::vector<std::string> const &words, std::size_t &position);

    /// Hands over the lists. Values of other kinds are in their Input as soon as take() has read them.
    void finish();

    /// @throws UsageError that names every required parameter that was not given.
    static void requireAll(Group const &group);

private:
    /// A declared parameter, where its values go, and those of a list so far.
    struct Target {
        void store(std::string const &option, std::string const &value);

        boost::shared_ptr<CallSpec::ParameterSpec> parameter;
        boost::shared_ptr<CallSpec::Input> input;
        bool given = false;
        std::vector<std::string> texts;
        std::vector<int64_t> numbers;
        std::vector<bool> truths;
    };

    Target const *find(std::string_view option) const;
    Target *find(std::string_view option);
    [[noreturn]] void failUnknown(std::string const &option) const;

    std::vector<Target> targets_;
    std::vector<std::string> otherNames_;
};

} // namespace Plexa
