// SPDX-License-Identifier: Apache-2.0
#include "https/HeldLists.h"

#include <iterator>
#include <utility>

namespace Orka::Https {

HeldLists::Pages const *HeldLists::find(std::string_view token) {
    auto const found = byToken_.find(token);
    if (found == byToken_.end()) {
        return nullptr;
    }
    lists_.splice(lists_.end(), lists_, found->second);
    return &found->second->pages;
}

void HeldLists::add(List list) {
    lists_.push_back(std::move(list));
    byToken_.emplace(lists_.back().token, std::prev(lists_.end()));
    while (lists_.size() > 1 && (lists_.size() > limits_.lists || elements_ > limits_.elements)) {
        forgetOldest();
    }
}

void HeldLists::forgetOldest() {
    auto &oldest = lists_.front();
    if (oldest.content.use_count() == 1) {
        elements_ -= oldest.content->elements;
    }
    byToken_.erase(oldest.token);
    lists_.pop_front();
}

} // namespace Orka::Https
