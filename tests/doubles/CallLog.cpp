// SPDX-License-Identifier: Apache-2.0
#include "doubles/CallLog.h"

namespace Doubles {

std::string quoted(std::string const &text) {
    std::string result = "\"";
    for (char const character : text) {
        switch (character) {
        case '\n':
            result += "\\n";
            break;
        case '\t':
            result += "\\t";
            break;
        case '"':
            result += "\\\"";
            break;
        case '\\':
            result += "\\\\";
            break;
        default:
            result += character;
        }
    }
    return result + "\"";
}

std::vector<std::string> CallLog::linesOf(std::string const &prefix) const {
    std::vector<std::string> result;
    for (std::string const &line : lines_) {
        if (line.compare(0, prefix.size(), prefix) == 0) {
            result.push_back(line);
        }
    }
    return result;
}

std::size_t CallLog::count(std::string const &prefix) const {
    return linesOf(prefix).size();
}

std::string CallLog::print(std::vector<std::string> const &texts) {
    std::string result = "[";
    char const *separator = "";
    for (std::string const &text : texts) {
        result += separator + quoted(text);
        separator = ", ";
    }
    return result + "]";
}

} // namespace Doubles
