// SPDX-License-Identifier: Apache-2.0
//
// A disk whose power is cut. While a PowerCut lives, whatever SQLite writes in this process goes through it to the real
// files and is noted: writes, truncations, syncs, files made and removed. Afterwards any moment of that story can be
// laid out in a directory as a disk might hold it when the power went then: what was synced is there, and of the rest
// any part may be, down to single sectors.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include <sqlite3.h>

class PowerCut {
public:
    /// @param directory whose files are noted; what lies in it now is on the disk already
    explicit PowerCut(std::string directory);
    ~PowerCut();
    PowerCut(PowerCut const &) = delete;
    PowerCut &operator=(PowerCut const &) = delete;

    /// The caller has been told that something is done.
    void acknowledge();
    /// Stops noting; SQLite works as usual again.
    void stop();

    /// How many moments there are: before the first event, and after each.
    std::size_t moments() const {
        return events_.size() + 1;
    }
    /// How many acknowledgements there had been at a moment.
    std::size_t acknowledgedAt(std::size_t moment) const;

    enum class Unsynced { Lost, Written, Torn };
    /// Lays out what the disk may hold when the power goes at that moment. Replaces what is in the directory.
    /// @param random decides what is left when unsynced writes are torn
    void layOut(std::size_t moment, Unsynced unsynced, std::mt19937 &random, std::string const &directory) const;

    // What the file methods tell.
    struct Event {
        enum class Kind { Write, Truncate, Sync, Make, Remove, SyncDirectory, Acknowledge };
        Kind kind;
        int file = -1; ///< a file keeps its number when its name goes to another
        std::string name;
        int64_t offset = 0;
        std::string bytes;
    };
    void note(Event event);
    int made(std::string const &path);
    void removed(std::string const &path);
    int numberOf(std::string const &path) const;

private:
    bool isNoted(std::string const &path) const;
    static std::string nameOf(std::string const &path);

    std::string directory_;
    std::map<std::string, std::string> before_;
    std::map<std::string, int> names_;
    std::map<std::string, int> namesBefore_;
    std::vector<Event> events_;
    int files_ = 0;
    std::unique_ptr<sqlite3_vfs> vfs_;
};
