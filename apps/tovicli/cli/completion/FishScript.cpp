// SPDX-License-Identifier: Apache-2.0
#include "completion/Scripts.h"

#include "plexa/Text.h"

namespace Tovicli::Cli {

namespace {

constexpr char const *head = R"script(# fish completion for tovicli. Made by: tovicli cli completion fish
# To use it:  tovicli cli completion fish | source
# or put it into ~/.config/fish/completions as tovicli.fish.

# The path that the words before the cursor lead to.
function __tovicli_path
    set -l tokens (commandline -opc)
    set -l path ''
    set -l skip no
    for token in $tokens[2..-1]
        if test $skip = yes
            set skip no
            continue
        end
        switch $token
            case '--*=*'
            case '-?*'
                if not contains -- "$path:$token" $__tovicli_flags; and not contains -- ":$token" $__tovicli_flags
                    set skip yes
                end
            case '*'
                if contains -- "$path" $__tovicli_namespaces
                    set path (string trim -- "$path $token")
                end
        end
    end
    echo -- $path
end

function __tovicli_at
    test (__tovicli_path) = "$argv[1]"
end

# Whether the path leads into a command: the tool's own options stand behind it too.
function __tovicli_anywhere
    true
end

function __tovicli_live
    set -l arguments
    set -l tokens (commandline -opc)
    for token in $tokens[2..-1]
        set -a arguments "--word=$token"
    end
    set -l current (commandline -ct)
    set -l found ($tokens[1] cli complete $arguments "--word=$current" 2>/dev/null </dev/null)
    printf '%s\n' $found[2..-1]
end

complete -c tovicli -e
)script";

std::string fishQuoted(std::string const &text) {
    std::string quoted = "'";
    for (char const c : Plexa::escaped(text)) {
        quoted += c == '\'' || c == '\\' ? std::string("\\") + c : std::string(1, c);
    }
    return quoted + "'";
}

/// Words as -a takes them, which expands patterns.
std::string unexpanded(std::string const &words) {
    std::string text;
    for (char const c : words) {
        text += c == '*' || c == '?' ? std::string("\\") + c : std::string(1, c);
    }
    return text;
}

/// The arguments that say what an option's value is.
std::string valueArguments(ValueSource const &source) {
    switch (source.kind) {
    case ValueSource::Kind::Flag:
        return "";
    case ValueSource::Kind::Files:
        return " -r -F";
    case ValueSource::Kind::Directories:
        return " -x -a '(__fish_complete_directories (commandline -ct))'";
    case ValueSource::Kind::Live:
    case ValueSource::Kind::Path:
        return " -x -a '(__tovicli_live)'";
    case ValueSource::Kind::Words: {
        std::string const all = sourceText(source).substr(std::string("words ").size());
        return " -x -a " + fishQuoted(unexpanded(all));
    }
    case ValueSource::Kind::Text:
        break;
    }
    return " -x";
}

std::string described(std::string const &description) {
    return description.empty() ? std::string() : " -d " + fishQuoted(description);
}

void addOptions(std::string &script, NodeEntry const &node) {
    std::string const where =
        node.path.empty() ? std::string("__tovicli_anywhere") : fishQuoted("__tovicli_at " + fishQuoted(node.path));
    for (OptionEntry const &option : node.options) {
        script += "complete -c tovicli -n " + where + " -l " + fishQuoted(option.name);
        script += option.alias.empty() ? std::string() : " -s " + fishQuoted(option.alias);
        script += valueArguments(option.source) + described(option.description) + "\n";
    }
}

} // namespace

std::string fishScript(std::vector<NodeEntry> const &table) {
    std::string script = head;
    std::string flags = "set -g __tovicli_flags";
    std::string namespaces = "set -g __tovicli_namespaces";
    for (NodeEntry const &node : table) {
        if (!node.isCommand) {
            namespaces += " " + fishQuoted(node.path);
        }
        for (OptionEntry const &option : node.options) {
            if (option.source.kind == ValueSource::Kind::Flag) {
                flags += " " + fishQuoted(node.path + ":--" + option.name);
                flags += option.alias.empty() ? "" : " " + fishQuoted(node.path + ":-" + option.alias);
            }
        }
    }
    script += flags + "\n" + namespaces + "\n";
    for (NodeEntry const &node : table) {
        std::string const at = fishQuoted("__tovicli_at " + fishQuoted(node.path));
        for (auto const &child : node.children) {
            script +=
                "complete -c tovicli -n " + at + " -f -a " + fishQuoted(child.first) + described(child.second) + "\n";
        }
        if (node.isCommand) {
            script += "complete -c tovicli -n " + at + " -f";
            bool const positional = node.positional.kind != ValueSource::Kind::Text;
            script += positional ? valueArguments(node.positional) : std::string();
            script += "\n";
        }
        addOptions(script, node);
    }
    return script;
}

} // namespace Tovicli::Cli
