// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <map>
#include <set>
#include <string>
#include <string_view>

namespace Lumod {

/// Which protocol endpoints have lost all their paths: what the host store keeps, and what events told since. An event
/// counts until the store says something new about the same endpoint.
class Outages {
public:
    using Uids = std::set<std::string, std::less<>>;

    void setStored(Uids stored) {
        for (auto event = events_.begin(); event != events_.end();) {
            bool const changed = stored.count(event->first) != stored_.count(event->first);
            event = changed ? events_.erase(event) : std::next(event);
        }
        stored_ = std::move(stored);
    }

    void note(std::string const &uid, bool outage) {
        events_[uid] = outage;
    }

    bool isOut(std::string_view uid) const {
        auto const event = events_.find(uid);
        return event != events_.end() ? event->second : stored_.find(uid) != stored_.end();
    }

    /// All that are out now.
    Uids all() const {
        Uids uids = stored_;
        for (auto const &[uid, outage] : events_) {
            if (outage) {
                uids.insert(uid);
            } else {
                uids.erase(uid);
            }
        }
        return uids;
    }

private:
    Uids stored_;
    std::map<std::string, bool, std::less<>> events_;
};

} // namespace Lumod
