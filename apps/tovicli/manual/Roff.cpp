// SPDX-License-Identifier: Apache-2.0
#include "Roff.h"

#include <cctype>

namespace Tovicli::Manual {

namespace {

std::string upper(std::string_view text) {
    std::string result;
    for (char const c : text) {
        result += static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    }
    return result;
}

} // namespace

std::string roff(std::string_view text) {
    std::string result;
    bool atLineStart = true;
    for (char const c : text) {
        if (atLineStart && (c == '.' || c == '\'')) {
            result += "\\&"; // else a request
        }
        switch (c) {
        case '\\':
            result += "\\e";
            break;
        case '-':
            result += "\\-";
            break;
        case '\'':
            result += "\\(aq";
            break;
        case '`':
            result += "\\(ga";
            break;
        case '^':
            result += "\\(ha";
            break;
        case '~':
            result += "\\(ti";
            break;
        default:
            result += c;
        }
        atLineStart = c == '\n';
    }
    return result;
}

std::string bold(std::string_view text) {
    return "\\fB" + roff(text) + "\\fR";
}

std::string italic(std::string_view text) {
    return "\\fI" + roff(text) + "\\fR";
}

std::string pageHead(std::string_view name, int section, std::string_view version) {
    // A longer name and the manual's would lie on each other in the page's first line.
    constexpr std::size_t longest = 30;
    std::string const title = upper(name.size() <= longest ? name : name.substr(0, name.find('-')));
    return ".\\\" Made when the project is built; do not change.\n.TH \"" + roff(title) + "\" " +
           std::to_string(section) + " \"\" \"Tovi " + std::string(version) + "\" \"Tovi Manual\"\n.nh\n.ad l\n";
}

std::string section(std::string_view title) {
    return ".SH " + std::string(title) + "\n";
}

std::string label(std::string const &formatted) {
    return ".TP\n" + formatted + "\n";
}

std::string verbatim(std::string_view text) {
    std::string lines = roff(text);
    if (!lines.ends_with('\n')) {
        lines += '\n';
    }
    return ".EX\n" + lines + ".EE\n";
}

} // namespace Tovicli::Manual
