// SPDX-License-Identifier: Apache-2.0
#include "completion/Scripts.h"

namespace Tovicli::Cli {

namespace {

constexpr char const *head = R"script(#compdef tovicli
# zsh completion for tovicli. Made by: tovicli cli completion zsh
# To use it:  source <(tovicli cli completion zsh)     (after compinit)
# or put it into a directory of $fpath as _tovicli.

# Names below each namespace, and options of each command, with descriptions; the key is its path, the program's name first. One a line.
typeset -gA _tovicli_children=()
typeset -gA _tovicli_options=()
# What a value is; the key is path:option.
typeset -gA _tovicli_values=()
# Options that may be given again and again.
typeset -gA _tovicli_repeated=()

)script";

constexpr char const *body = R"script(
# _tovicli_offer TAG LINES: each line is "name:description".
_tovicli_offer() {
    local -a entries=("${(@f)2}")
    (( ${#entries} )) && _describe "$1" entries
}

_tovicli_live() {
    local -a arguments=() found=() entries=()
    local word line
    for word in "${(@)words[2,CURRENT-1]}" "$PREFIX"; do
        arguments+=("--word=$word")
    done
    found=("${(@f)$("${words[1]}" cli complete "${arguments[@]}" 2>/dev/null </dev/null)}")
    for line in "${(@)found[2,-1]}"; do
        [[ -n $line ]] && entries+=("${${line%%$'\t'*}//:/\\:}:${line#*$'\t'}")
    done
    (( ${#entries} )) && _describe value entries
}

# _tovicli_value WHAT
_tovicli_value() {
    case "$1" in
    words\ *) local -a found=(${(s: :)${1#words }}); compadd -a found ;;
    files) _files ;;
    directories) _files -/ ;;
    live | path) _tovicli_live ;;
    *) _message 'a value' ;;
    esac
}

# Options of a node without those that stand in the line already.
_tovicli_remaining() {
    local -a left=()
    local line name
    for line in "${(@f)_tovicli_options[$1]}"; do
        name="${line%%:*}"
        if [[ -n $name ]] &&
            { [[ -n ${_tovicli_repeated[$1:$name]} ]] || (( ! ${words[(I)$name(|=*)]} )) || [[ ${words[CURRENT]} == $name ]] }; then
            left+=("$line")
        fi
    done
    print -rl -- "${left[@]}"
}

_tovicli() {
    local path_='tovicli' option='' word kind i
    for ((i = 2; i < CURRENT; i++)); do
        word="${(Q)words[i]}"
        if [[ -n $option ]]; then
            option=''
        elif [[ $word == -?* ]]; then
            if [[ $word != --*=* ]]; then
                kind="${_tovicli_values[$path_:$word]:-${_tovicli_values[tovicli:$word]:-flag}}"
                [[ $kind == flag ]] || option="$word"
            fi
        elif [[ -n ${_tovicli_children[$path_]} ]]; then
            path_="$path_ $word"
            (( ${+_tovicli_children[$path_]} || ${+_tovicli_options[$path_]} )) || return 1
        fi
    done
    if [[ -z $option && $PREFIX == --*=* ]]; then
        option="${PREFIX%%=*}"
        words[CURRENT]="$option"
        words=("${(@)words[1,CURRENT]}" '')
        (( CURRENT++ ))
        compset -P 1 '*='
    fi
    if [[ -n $option ]]; then
        _tovicli_value "${_tovicli_values[$path_:$option]:-${_tovicli_values[tovicli:$option]:-text}}"
    elif [[ $PREFIX == -* ]]; then
        _tovicli_offer option "$(_tovicli_remaining "$path_")"
        [[ $path_ == tovicli ]] || _tovicli_offer 'global option' "$(_tovicli_remaining tovicli)"
    elif [[ -n ${_tovicli_children[$path_]} ]]; then
        _tovicli_offer command "${_tovicli_children[$path_]}"
    elif [[ -n ${_tovicli_values[$path_:]} ]]; then
        _tovicli_value "${_tovicli_values[$path_:]}"
    else
        _tovicli_offer option "$(_tovicli_remaining "$path_")"
    fi
}

if [[ $funcstack[1] == _tovicli ]]; then
    _tovicli "$@"
else
    compdef _tovicli tovicli
fi
)script";

/// "name:description", colons of the name's own escaped, as _describe reads it.
std::string entry(std::string const &name, std::string const &description) {
    std::string text;
    for (char const c : name) {
        text += c == ':' ? std::string("\\:") : std::string(1, c);
    }
    return text + ":" + description;
}

} // namespace

std::string zshScript(std::vector<NodeEntry> const &table) {
    std::string script = head;
    auto const set = [&script](char const *array, std::string const &key, std::string const &value) {
        script += std::string("_tovicli_") + array + "+=(" + shellQuoted(key) + " " + value + ")\n";
    };
    // One entry a line, each quoted by itself, since quoting escapes what is no plain text.
    auto const add = [](std::string &to, std::string const &line) {
        to += (to.empty() ? "" : "$'\\n'") + shellQuoted(line);
    };
    for (NodeEntry const &node : table) {
        std::string const path = "tovicli" + (node.path.empty() ? std::string() : " " + node.path);
        std::string children;
        for (auto const &child : node.children) {
            add(children, entry(child.first, child.second));
        }
        if (!node.isCommand && !children.empty()) {
            set("children", path, children);
        }
        std::string options;
        for (OptionEntry const &option : node.options) {
            add(options, entry("--" + option.name, option.description));
        }
        if (node.isCommand || node.path.empty()) {
            set("options", path, options.empty() ? "''" : options);
        }
        for (OptionEntry const &option : node.options) {
            std::string const source = shellQuoted(sourceText(option.source));
            set("values", path + ":--" + option.name, source);
            if (!option.alias.empty()) {
                set("values", path + ":-" + option.alias, source);
            }
            if (option.isList) {
                set("repeated", path + ":--" + option.name, "yes");
            }
        }
        if (node.positional.kind != ValueSource::Kind::Text) {
            set("values", path + ":", shellQuoted(sourceText(node.positional)));
        }
    }
    return script + body;
}

} // namespace Tovicli::Cli
