// SPDX-License-Identifier: Apache-2.0
#include "kestrel/Util.h"

namespace Kestrel::Util {

std::string VectorToString(std::vector<std::string> const &elements, std::string const &separator) {
    std::string joined;
    for (std::string const &element : elements) {
        if (&element != &elements.front()) {
            joined += separator;
        }
        joined += element;
    }
    return joined;
}

} // namespace Kestrel::Util
