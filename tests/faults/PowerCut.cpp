// SPDX-License-Identifier: Apache-2.0
#include "PowerCut.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>
#include <utility>

namespace {

namespace fs = std::filesystem;
using Event = PowerCut::Event;
using Kind = Event::Kind;

/// What a disk writes as a whole or not at all.
constexpr int64_t sectorBytes = 512;

std::string bytesOf(fs::path const &path) {
    std::ostringstream bytes;
    bytes << std::ifstream(path, std::ios::binary).rdbuf();
    return bytes.str();
}

void writeAt(std::string &content, int64_t offset, std::string const &bytes) {
    auto const begin = static_cast<std::size_t>(offset);
    content.resize(std::max(content.size(), begin + bytes.size()));
    content.replace(begin, bytes.size(), bytes);
}

/// The parts of a write that reach the disk one by one.
std::vector<Event> sectorsOf(Event const &write) {
    std::vector<Event> parts;
    for (std::size_t done = 0; done < write.bytes.size();) {
        int64_t const offset = write.offset + static_cast<int64_t>(done);
        auto const room = static_cast<std::size_t>(sectorBytes - offset % sectorBytes);
        Event part{Kind::Write, write.file, {}, offset, write.bytes.substr(done, room)};
        done += part.bytes.size();
        parts.push_back(std::move(part));
    }
    return parts;
}

void apply(Event const &change, std::string &content) {
    if (change.kind == Kind::Truncate) {
        content.resize(static_cast<std::size_t>(change.offset));
    } else {
        writeAt(content, change.offset, change.bytes);
    }
}

/// One file that SQLite has open, in front of the real one, which lies behind it in the same memory.
struct NotedFile {
    sqlite3_file base;
    PowerCut *powerCut;
    int number;

    sqlite3_file *real() {
        return reinterpret_cast<sqlite3_file *>(this + 1);
    }
    static NotedFile &of(sqlite3_file *file) {
        return *reinterpret_cast<NotedFile *>(file);
    }
};

template <typename Method, typename... Arguments>
int passOn(Method sqlite3_io_methods::*method, sqlite3_file *file, Arguments... arguments) {
    sqlite3_file *const real = NotedFile::of(file).real();
    return (real->pMethods->*method)(real, arguments...);
}

int closeFile(sqlite3_file *file) {
    return passOn(&sqlite3_io_methods::xClose, file);
}
int readFile(sqlite3_file *file, void *buffer, int size, sqlite3_int64 offset) {
    return passOn(&sqlite3_io_methods::xRead, file, buffer, size, offset);
}
int writeFile(sqlite3_file *file, void const *buffer, int size, sqlite3_int64 offset) {
    NotedFile const &noted = NotedFile::of(file);
    noted.powerCut->note({Kind::Write,
                          noted.number,
                          {},
                          offset,
                          std::string(static_cast<char const *>(buffer), static_cast<std::size_t>(size))});
    return passOn(&sqlite3_io_methods::xWrite, file, buffer, size, offset);
}
int truncateFile(sqlite3_file *file, sqlite3_int64 size) {
    NotedFile const &noted = NotedFile::of(file);
    noted.powerCut->note({Kind::Truncate, noted.number, {}, size, {}});
    return passOn(&sqlite3_io_methods::xTruncate, file, size);
}
int syncFile(sqlite3_file *file, int flags) {
    NotedFile const &noted = NotedFile::of(file);
    int const result = passOn(&sqlite3_io_methods::xSync, file, flags);
    noted.powerCut->note({Kind::Sync, noted.number, {}, 0, {}});
    return result;
}
int sizeOfFile(sqlite3_file *file, sqlite3_int64 *size) {
    return passOn(&sqlite3_io_methods::xFileSize, file, size);
}
int lockFile(sqlite3_file *file, int level) {
    return passOn(&sqlite3_io_methods::xLock, file, level);
}
int unlockFile(sqlite3_file *file, int level) {
    return passOn(&sqlite3_io_methods::xUnlock, file, level);
}
int checkReserved(sqlite3_file *file, int *isReserved) {
    return passOn(&sqlite3_io_methods::xCheckReservedLock, file, isReserved);
}
int controlFile(sqlite3_file *file, int operation, void *argument) {
    return passOn(&sqlite3_io_methods::xFileControl, file, operation, argument);
}
int sectorSize(sqlite3_file *file) {
    return passOn(&sqlite3_io_methods::xSectorSize, file);
}
int deviceCharacteristics(sqlite3_file *file) {
    return passOn(&sqlite3_io_methods::xDeviceCharacteristics, file);
}

sqlite3_io_methods const notedMethods = {
    1,          closeFile,     readFile,    writeFile,  truncateFile,          syncFile, sizeOfFile, lockFile,
    unlockFile, checkReserved, controlFile, sectorSize, deviceCharacteristics, nullptr,  nullptr,    nullptr,
    nullptr,    nullptr,       nullptr};

sqlite3_vfs *realVfs() {
    return sqlite3_vfs_find("unix");
}

int openFile(sqlite3_vfs *vfs, char const *name, sqlite3_file *file, int flags, int *outFlags) {
    auto *const powerCut = static_cast<PowerCut *>(vfs->pAppData);
    NotedFile &noted = NotedFile::of(file);
    noted.base.pMethods = nullptr;
    noted.powerCut = powerCut;
    bool const isNew = name != nullptr && !fs::exists(name);
    int const result = realVfs()->xOpen(realVfs(), name, noted.real(), flags, outFlags);
    if (noted.real()->pMethods != nullptr) {
        noted.base.pMethods = &notedMethods;
    }
    if (result == SQLITE_OK && name != nullptr) {
        noted.number = isNew ? powerCut->made(name) : powerCut->numberOf(name);
    }
    return result;
}

int deleteFile(sqlite3_vfs *vfs, char const *name, int syncsDirectory) {
    auto *const powerCut = static_cast<PowerCut *>(vfs->pAppData);
    int const result = realVfs()->xDelete(realVfs(), name, syncsDirectory);
    if (result == SQLITE_OK) {
        powerCut->removed(name);
        if (syncsDirectory != 0) {
            powerCut->note({Kind::SyncDirectory, -1, {}, 0, {}});
        }
    }
    return result;
}

} // namespace

PowerCut::PowerCut(std::string directory)
    : directory_(std::move(directory))
    , vfs_(std::make_unique<sqlite3_vfs>(*realVfs())) {
    for (fs::directory_entry const &entry : fs::directory_iterator(directory_)) {
        if (entry.is_regular_file()) {
            std::string const name = entry.path().filename().string();
            before_[name] = bytesOf(entry.path());
            namesBefore_[name] = names_[name] = files_++;
        }
    }
    vfs_->szOsFile += static_cast<int>(sizeof(NotedFile));
    vfs_->zName = "power-cut";
    vfs_->pAppData = this;
    vfs_->pNext = nullptr;
    vfs_->xOpen = openFile;
    vfs_->xDelete = deleteFile;
    sqlite3_vfs_register(vfs_.get(), 1);
}

PowerCut::~PowerCut() {
    stop();
}

void PowerCut::stop() {
    if (vfs_) {
        sqlite3_vfs_unregister(vfs_.get());
        sqlite3_vfs_register(realVfs(), 1);
        vfs_.reset();
    }
}

void PowerCut::acknowledge() {
    events_.push_back({Kind::Acknowledge, -1, {}, 0, {}});
}

std::size_t PowerCut::acknowledgedAt(std::size_t moment) const {
    return static_cast<std::size_t>(std::count_if(events_.begin(),
                                                  events_.begin() + static_cast<std::ptrdiff_t>(moment),
                                                  [](Event const &event) { return event.kind == Kind::Acknowledge; }));
}

bool PowerCut::isNoted(std::string const &path) const {
    return fs::path(path).parent_path() == directory_;
}

std::string PowerCut::nameOf(std::string const &path) {
    return fs::path(path).filename().string();
}

void PowerCut::note(Event event) {
    if (event.kind == Kind::SyncDirectory || event.file >= 0) {
        events_.push_back(std::move(event));
    }
}

int PowerCut::made(std::string const &path) {
    if (!isNoted(path)) {
        return -1;
    }
    std::string const name = nameOf(path);
    names_[name] = files_;
    events_.push_back({Kind::Make, files_, name, 0, {}});
    return files_++;
}

void PowerCut::removed(std::string const &path) {
    if (isNoted(path)) {
        events_.push_back({Kind::Remove, numberOf(path), nameOf(path), 0, {}});
        names_.erase(nameOf(path));
    }
}

int PowerCut::numberOf(std::string const &path) const {
    auto const found = isNoted(path) ? names_.find(nameOf(path)) : names_.end();
    return found == names_.end() ? -1 : found->second;
}

void PowerCut::layOut(std::size_t moment, Unsynced unsynced, std::mt19937 &random, std::string const &directory) const {
    auto const isKept = [&] {
        return unsynced == Unsynced::Written || (unsynced == Unsynced::Torn && random() % 2 == 0);
    };
    std::map<int, std::string> contents;
    for (auto const &[name, number] : namesBefore_) {
        contents[number] = before_.at(name);
    }
    std::map<int, std::vector<Event const *>> pending;
    std::map<std::string, int> names = namesBefore_;
    std::vector<Event const *> pendingNames;
    auto const rename = [&names](Event const &event) {
        if (event.kind == Kind::Make) {
            names[event.name] = event.file;
        } else {
            names.erase(event.name);
        }
    };
    auto const syncNames = [&] {
        std::for_each(pendingNames.begin(), pendingNames.end(), [&](Event const *event) { rename(*event); });
        pendingNames.clear();
    };
    for (std::size_t i = 0; i < moment; ++i) {
        Event const &event = events_[i];
        switch (event.kind) {
        case Kind::Write:
        case Kind::Truncate:
            pending[event.file].push_back(&event);
            break;
        case Kind::Sync: {
            for (Event const *change : pending[event.file]) {
                apply(*change, contents[event.file]);
            }
            pending[event.file].clear();
            // SQLite syncs the directory with the first sync of a journal that it has made.
            bool const isNew = std::any_of(pendingNames.begin(), pendingNames.end(), [&](Event const *name) {
                return name->kind == Kind::Make && name->file == event.file &&
                       name->name.find("-journal") != std::string::npos;
            });
            if (isNew) {
                syncNames();
            }
            break;
        }
        case Kind::Make:
        case Kind::Remove:
            pendingNames.push_back(&event);
            break;
        case Kind::SyncDirectory:
            syncNames();
            break;
        case Kind::Acknowledge:
            break;
        }
    }
    // Names change in their order, but how many of the changes have reached the disk nobody knows.
    for (Event const *change : pendingNames) {
        if (!isKept()) {
            break;
        }
        rename(*change);
    }
    for (auto const &[number, changes] : pending) {
        for (Event const *change : changes) {
            for (Event const &part : change->kind == Kind::Write ? sectorsOf(*change) : std::vector<Event>{*change}) {
                if (isKept()) {
                    apply(part, contents[number]);
                }
            }
        }
    }
    fs::remove_all(directory);
    fs::create_directories(directory);
    for (auto const &[name, number] : names) {
        std::ofstream(fs::path(directory) / name, std::ios::binary) << contents[number];
    }
}
