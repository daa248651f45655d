// SPDX-License-Identifier: Apache-2.0
#include "completion/Completer.h"

#include <set>
#include <utility>

#include "Settings.h"
#include "completion/ValueSource.h"

namespace Tovicli::Cli {

using namespace Plexa;

namespace {

using ParameterPtr = boost::shared_ptr<CallSpec::ParameterSpec>;

bool isList(CallSpec::ParameterType type) {
    return type == CallSpec::StringList || type == CallSpec::IntList || type == CallSpec::BoolList;
}

/// Reads the words before the one to complete, and then says what that one could be.
class Reading {
public:
    Reading(NodePtr const &root, LiveQuery const &query, AskLive const &ask)
        : root_(root)
        , node_(root)
        , query_(query)
        , ask_(ask)
        , globals_(globalOptions()->GetParameters()) {}

    /// @return false when they name nothing
    bool read(std::vector<std::string> const &words) {
        for (std::string const &word : words) {
            if (expecting_ != nullptr) {
                note(*expecting_, word);
                expecting_ = nullptr;
            } else if (word.size() > 1 && word[0] == '-') {
                readOption(word);
            } else if (command_ != nullptr) {
                positional_.push_back(word);
            } else if (!descend(word)) {
                return false;
            }
        }
        return true;
    }

    Completion complete(std::string const &current) {
        std::size_t const equals = current.starts_with("--") ? current.find('=') : std::string::npos;
        if (expecting_ != nullptr) {
            return values(*expecting_, current, {});
        }
        if (equals != std::string::npos) {
            ParameterPtr const parameter = find(current.substr(0, equals));
            return parameter != nullptr ? values(*parameter, current.substr(equals + 1), current.substr(0, equals + 1))
                                        : Completion();
        }
        if (current.starts_with("-")) {
            return options(current, true);
        }
        if (command_ == nullptr) {
            return children(*node_, current);
        }
        ParameterPtr const positional = find("--" + command_->GetMetaDataField("positional"));
        return positional != nullptr ? values(*positional, current, {}) : options(current, false);
    }

private:
    bool descend(std::string const &word) {
        NodePtr const child = node_->GetNamespaceNode(word);
        if (child == nullptr) {
            return false;
        }
        node_ = child;
        command_ = boost::dynamic_pointer_cast<AutoCli::Command>(child);
        if (command_ != nullptr) {
            InputSpecPtr const spec = command_->GetInputSpec();
            own_ = spec != nullptr ? spec->GetParameters() : std::vector<ParameterPtr>();
        }
        return true;
    }

    void readOption(std::string const &word) {
        std::size_t const equals = word.starts_with("--") ? word.find('=') : std::string::npos;
        ParameterPtr const parameter = find(word.substr(0, equals));
        if (parameter == nullptr) {
            return; // a mistake, which the tool itself will tell
        }
        if (equals != std::string::npos) {
            note(*parameter, word.substr(equals + 1));
        } else if (parameter->GetType() == CallSpec::Flag) {
            note(*parameter, {});
        } else {
            expecting_ = parameter;
        }
    }

    void note(CallSpec::ParameterSpec const &parameter, std::string const &value) {
        given_.insert(parameter.GetName());
        if (parameter.GetName() == "root" && !isOwn(parameter) && !value.empty()) {
            query_.root = value;
        } else if (parameter.GetName() == "container-id") {
            query_.containerId = value;
        }
    }

    bool isOwn(CallSpec::ParameterSpec const &parameter) const {
        for (ParameterPtr const &own : own_) {
            if (own.get() == &parameter) {
                return true;
            }
        }
        return false;
    }

    /// The command's parameter of that name or letter, else the tool's option.
    ParameterPtr find(std::string const &option) const {
        bool const isLong = option.starts_with("--");
        std::string const name = option.substr(isLong ? 2 : 1);
        for (auto const *parameters : {&own_, &globals_}) {
            for (ParameterPtr const &parameter : *parameters) {
                if (!name.empty() && name == (isLong ? parameter->GetName() : parameter->GetAlias())) {
                    return parameter;
                }
            }
        }
        return nullptr;
    }

    static void add(Completion &completion, Candidate candidate, std::string const &typed) {
        if (candidate.value.starts_with(typed)) {
            completion.candidates.push_back(std::move(candidate));
        }
    }

    static Completion children(AutoCli::NamespaceNode &node, std::string const &typed) {
        Completion completion;
        for (NodePtr const &child : node.GetNamespaceNodes()) {
            add(completion, {child->GetName(), child->GetDescription()}, typed);
        }
        return completion;
    }

    Completion options(std::string const &typed, bool withGlobals) const {
        Completion completion;
        std::set<std::string> offered;
        auto const offer = [&](std::vector<ParameterPtr> const &parameters) {
            for (ParameterPtr const &parameter : parameters) {
                std::string const name = parameter->GetName();
                bool const again = isList(parameter->GetType()) || !given_.contains(name);
                if (again && offered.insert(name).second) {
                    add(completion, {"--" + name, parameter->GetDescription()}, typed);
                }
            }
        };
        offer(own_);
        if (withGlobals) {
            offer(globals_);
        }
        return completion;
    }

    Completion values(CallSpec::ParameterSpec const &parameter, std::string const &typed, std::string const &before) {
        ValueSource const source = sourceOf(isOwn(parameter) ? node_->GetPathString(' ') : "", parameter);
        Completion completion;
        completion.before = before;
        switch (source.kind) {
        case ValueSource::Kind::Flag:
        case ValueSource::Kind::Text:
            break;
        case ValueSource::Kind::Words:
            for (std::string const &word : source.words) {
                add(completion, {word}, typed);
            }
            break;
        case ValueSource::Kind::Files:
            completion.kind = Completion::Kind::Files;
            break;
        case ValueSource::Kind::Directories:
            completion.kind = Completion::Kind::Directories;
            break;
        case ValueSource::Kind::Path:
            addPathWords(completion, typed);
            break;
        case ValueSource::Kind::Live:
            query_.live = source.live;
            for (Candidate &candidate : ask_(query_)) {
                add(completion, std::move(candidate), typed);
            }
            break;
        }
        return completion;
    }

    void addPathWords(Completion &completion, std::string const &typed) const {
        NodePtr node = root_;
        for (std::string const &word : positional_) {
            node = node->GetNamespaceNode(word);
            if (node == nullptr) {
                return;
            }
        }
        completion.candidates = children(*node, typed).candidates;
    }

    NodePtr root_;
    NodePtr node_;
    CommandPtr command_;
    LiveQuery query_;
    AskLive const &ask_;
    std::vector<ParameterPtr> globals_;
    std::vector<ParameterPtr> own_;
    ParameterPtr expecting_;
    std::vector<std::string> positional_;
    std::set<std::string> given_;
};

} // namespace

Completion complete(NodePtr const &root, LiveQuery const &query, AskLive const &ask,
                    std::vector<std::string> const &words, std::string const &current) {
    Reading reading(root, query, ask);
    return reading.read(words) ? reading.complete(current) : Completion();
}

} // namespace Tovicli::Cli
