// SPDX-License-Identifier: Apache-2.0
#include "completion/Scripts.h"

namespace Tovicli::Cli {

namespace {

constexpr char const *head = R"script(# bash completion for tovicli. Made by: tovicli cli completion bash
# To use it:  source <(tovicli cli completion bash)

# Names below each namespace; the key is its path, the program's name first.
declare -gA _tovicli_children=()
# Options of each command; those of the tool itself stand under its name.
declare -gA _tovicli_options=()
# What a value is; the key is path:option.
declare -gA _tovicli_values=()
# Options that may be given again and again.
declare -gA _tovicli_repeated=()

)script";

constexpr char const *body = R"script(
# Leaves the words up to the cursor in $words. Bash breaks them at = and : too; what stood together is put together.
_tovicli_words() {
    local rest="${COMP_LINE:0:COMP_POINT}" word before i
    words=()
    for ((i = 0; i <= COMP_CWORD; i++)); do
        word="${COMP_WORDS[i]}"
        before="${rest%%[! $'\t']*}"
        rest="${rest:${#before}}"
        if ((i == COMP_CWORD)) && [[ -n $rest || -n $before ]]; then
            word="$rest"
        fi
        rest="${rest:${#word}}"
        piece="$word"
        if [[ -z $before && $i -gt 0 && -n $COMP_LINE ]]; then
            words[-1]+="$word"
        else
            words+=("$word")
        fi
    done
}

_tovicli_live() {
    local -a arguments=()
    local word
    for word in "${words[@]:1}"; do
        arguments+=("--word=$word")
    done
    mapfile -t found < <("${words[0]}" cli complete "${arguments[@]}" 2>/dev/null </dev/null)
    found=("${found[@]:1}")
    found=("${found[@]%%$'\t'*}")
}

# Leaves what a value could be in $found. Arguments: what it is, what is typed of it.
_tovicli_candidates() {
    found=()
    case "$1" in
    words\ *) read -ra found <<<"${1#words }" ;;
    live | path) _tovicli_live ;;
    files | directories)
        filenames=yes
        compopt -o filenames 2>/dev/null
        if [[ $1 == files ]]; then
            mapfile -t found < <(compgen -f -- "$2")
        else
            mapfile -t found < <(compgen -d -- "$2")
        fi
        ;;
    esac
}

_tovicli() {
    local -a words found=()
    local filenames='' piece path='tovicli' option='' word i kind current typed before=''
    COMPREPLY=()
    _tovicli_words
    for ((i = 1; i < ${#words[@]} - 1; i++)); do
        word="${words[i]}"
        if [[ -n $option ]]; then
            option=''
        elif [[ $word == -?* ]]; then
            if [[ $word != --*=* ]]; then
                kind="${_tovicli_values["$path:$word"]-${_tovicli_values["tovicli:$word"]-flag}}"
                [[ $kind == flag ]] || option="$word"
            fi
        elif [[ -n ${_tovicli_children["$path"]-} ]]; then
            path="$path $word"
            [[ -n ${_tovicli_children["$path"]-}${_tovicli_options["$path"]+command} ]] || return 0
        fi
    done
    current="${words[-1]}"
    if [[ -z $option && $current == --*=* ]]; then
        option="${current%%=*}"
        before="$option="
        words=("${words[@]:0:${#words[@]}-1}" "$option" "${current#*=}")
    fi
    typed="${current#"$before"}"
    typed="${typed#[\'\"]}"
    typed="${typed//\\/}"
    if [[ -n $option ]]; then
        _tovicli_candidates "${_tovicli_values["$path:$option"]-${_tovicli_values["tovicli:$option"]-text}}" "$typed"
    elif [[ $current == -* ]]; then
        read -ra found <<<"${_tovicli_options["$path"]-} ${_tovicli_options["tovicli"]-}"
        _tovicli_drop_given
    elif [[ -n ${_tovicli_children["$path"]-} ]]; then
        read -ra found <<<"${_tovicli_children["$path"]}"
    elif [[ -n ${_tovicli_values["$path:"]-} ]]; then
        _tovicli_candidates "${_tovicli_values["$path:"]}" "$typed"
    else
        read -ra found <<<"${_tovicli_options["$path"]-}"
        _tovicli_drop_given
    fi
    _tovicli_reply
}

# Takes out of $found the options that stand in the line already and are given once only.
_tovicli_drop_given() {
    local -a left=()
    local option word given
    for option in "${found[@]}"; do
        given=''
        for word in "${words[@]:1:${#words[@]}-2}"; do
            [[ $word == "$option" || $word == "$option="* ]] && given=yes
        done
        [[ -n $given && -z ${_tovicli_repeated["$path:$option"]-} ]] || left+=("$option")
    done
    found=("${left[@]}")
}

# From $found to COMPREPLY: what begins with $typed, quoted where it has to be, without what bash takes for earlier words.
_tovicli_reply() {
    local candidate strip=''
    if [[ $piece == [=:] ]]; then
        strip="$current"
    elif [[ $current == *"$piece" ]]; then
        strip="${current%"$piece"}"
    fi
    for candidate in "${found[@]}"; do
        if [[ $candidate == "$typed"* ]]; then
            if [[ $piece != [\'\"]* && $candidate != "$typed" && -z $filenames ]]; then
                printf -v candidate %q "$candidate"
                candidate="${candidate//\\=/=}"
            fi
            candidate="$before$candidate"
            COMPREPLY+=("${candidate#"$strip"}")
        fi
    done
}

complete -F _tovicli tovicli
)script";

} // namespace

std::string bashScript(std::vector<NodeEntry> const &table) {
    std::string script = head;
    auto const set = [&script](char const *array, std::string const &key, std::string const &value) {
        script += std::string("_tovicli_") + array + "[" + shellQuoted(key) + "]=" + shellQuoted(value) + "\n";
    };
    auto const joined = [](std::string &to, std::string const &word) { to += (to.empty() ? "" : " ") + word; };
    for (NodeEntry const &node : table) {
        std::string const path = "tovicli" + (node.path.empty() ? std::string() : " " + node.path);
        std::string children;
        for (auto const &child : node.children) {
            joined(children, child.first);
        }
        if (!node.isCommand) {
            set("children", path, children);
        }
        std::string options;
        for (OptionEntry const &option : node.options) {
            joined(options, "--" + option.name);
        }
        if (node.isCommand || node.path.empty()) {
            set("options", path, options);
        }
        for (OptionEntry const &option : node.options) {
            set("values", path + ":--" + option.name, sourceText(option.source));
            if (!option.alias.empty()) {
                set("values", path + ":-" + option.alias, sourceText(option.source));
            }
            if (option.isList) {
                set("repeated", path + ":--" + option.name, "yes");
            }
        }
        if (node.positional.kind != ValueSource::Kind::Text) {
            set("values", path + ":", sourceText(node.positional));
        }
    }
    return script + body;
}

} // namespace Tovicli::Cli
