// SPDX-License-Identifier: Apache-2.0
#include "orka/conformance/Bugs.h"

#include <algorithm>

#include "conformance/bugs/Forwarding.h"

namespace Orka::Conformance {

std::vector<Bug> const &bugs() {
    static std::vector<Bug> const all = [] {
        std::vector<Bug> gathered;
        for (auto *const part : {listBugs, mutationBugs, answerBugs, keyBugs}) {
            auto const some = part();
            gathered.insert(gathered.end(), some.begin(), some.end());
        }
        return gathered;
    }();
    return all;
}

std::unique_ptr<Provider> makeBuggy(std::string const &name, std::unique_ptr<Provider> inner, kj::Timer &timer) {
    auto const bug = std::find_if(bugs().begin(), bugs().end(), [&](Bug const &one) { return name == one.name; });
    if (bug == bugs().end()) {
        throw Wire::Failure(Wire::ErrorCode::InvalidArgument, "there is no bug '" + name + "'");
    }
    return bug->put(std::move(inner), timer);
}

} // namespace Orka::Conformance
