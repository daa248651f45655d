// SPDX-License-Identifier: Apache-2.0
//
// Lists of which somebody may still ask for pages. What many hosts are told at one moment is mostly the same list, so
// each content is kept once, and the bound is on what is kept, not on how many ask: a fleet that starts at once may
// have thousands of lists on their way. What was not asked for the longest goes first.
#pragma once

#include <algorithm>
#include <cstddef>
#include <functional>
#include <list>
#include <memory>
#include <string>
#include <string_view>
#include <typeindex>
#include <unordered_map>
#include <utility>
#include <vector>

namespace Orka::Https {

struct HeldLimits {
    std::size_t lists;
    std::size_t elements; ///< of all contents; one list is held however long it is
};

class HeldLists {
public:
    /// The page from an offset on, so many elements at most.
    using Pages = std::function<std::string(std::size_t offset, std::size_t most)>;

    explicit HeldLists(HeldLimits limits)
        : limits_(limits) {}

    /// Holds a list under a token that is no other's. @param pagesOf gives, for the content that is kept, its pages
    template <typename T, typename PagesOf>
    void hold(std::string token, std::shared_ptr<std::vector<T> const> items, PagesOf const &pagesOf) {
        auto content = same(items);
        if (content == nullptr) {
            content = std::make_shared<Content const>(Content{items, typeid(T), items->size()});
            elements_ += content->elements;
        }
        auto pages = pagesOf(std::static_pointer_cast<std::vector<T> const>(content->items));
        add({std::move(token), std::move(content), std::move(pages)});
    }

    /// The pages of a list, nothing when it is held no longer.
    Pages const *find(std::string_view token);

    std::size_t elements() const {
        return elements_;
    }

private:
    struct Content {
        std::shared_ptr<void const> items;
        std::type_index type;
        std::size_t elements;
    };
    struct List {
        std::string token;
        std::shared_ptr<Content const> content;
        Pages pages;
    };

    /// A content that is kept already and is the same; null when there is none. The newest are looked at first: who
    /// asks at the same moment is told the same.
    template <typename T>
    std::shared_ptr<Content const> same(std::shared_ptr<std::vector<T> const> const &items) const {
        Content const *compared = nullptr;
        auto const found = std::find_if(lists_.rbegin(), lists_.rend(), [&](List const &list) {
            // Neighbours mostly share theirs, and need no second look.
            if (list.content.get() == std::exchange(compared, list.content.get())) {
                return false;
            }
            return compared->type == typeid(T) && compared->elements == items->size() &&
                   (compared->items == items || *static_cast<std::vector<T> const *>(compared->items.get()) == *items);
        });
        return found == lists_.rend() ? nullptr : found->content;
    }

    void add(List list);
    void forgetOldest();

    HeldLimits limits_;
    std::list<List> lists_; ///< the one that was asked for last at the end
    std::unordered_map<std::string_view, std::list<List>::iterator> byToken_;
    std::size_t elements_ = 0;
};

} // namespace Orka::Https
