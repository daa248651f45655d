// SPDX-License-Identifier: Apache-2.0
//
// Where file systems stand that are handed out: very many at once, which the caller deletes one by one. Those of one
// call share blocks of memory, and each block its host: an allocation of its own for every object and every name was a
// quarter of the instructions of a load that finds everything mounted.
#pragma once

#include <atomic>
#include <cstddef>
#include <memory>
#include <string_view>

namespace Kestrel {

struct Host;
class LumoFileSystem;

/// A piece of memory that lives until the last of its holders lets go: the file systems in it, and who fills it.
class FileSystemBlock {
public:
    /// @param bytes room for file systems and their names; held by the caller
    static FileSystemBlock *make(std::shared_ptr<Host> host, std::size_t bytes);
    /// The room that a file system of that name needs.
    static std::size_t roomFor(std::string_view name) noexcept;

    /// @return null when there is no room left; otherwise a file system that holds the block
    LumoFileSystem *add(std::string_view name, std::string_view containerId) noexcept;
    void letGo() noexcept;

    std::shared_ptr<Host> const &host() const noexcept {
        return host_;
    }

private:
    FileSystemBlock(std::shared_ptr<Host> host, std::size_t bytes) noexcept;
    ~FileSystemBlock() = default;

    std::shared_ptr<Host> host_;
    std::atomic<std::size_t> holders_{1};
    std::byte *free_;
    std::byte *end_;
};

/// Makes file systems of one host, each of which belongs to the caller.
class FileSystemMaker {
public:
    explicit FileSystemMaker(std::shared_ptr<Host> host);

    std::unique_ptr<LumoFileSystem> make(std::string_view name, std::string_view containerId);

    /// One alone, in a block that is no larger than it.
    static std::unique_ptr<LumoFileSystem> makeOne(std::shared_ptr<Host> host, std::string_view name,
                                                   std::string_view containerId);

private:
    struct LetGo {
        void operator()(FileSystemBlock *block) const noexcept {
            block->letGo();
        }
    };
    using Held = std::unique_ptr<FileSystemBlock, LetGo>;

    std::shared_ptr<Host> host_;
    Held block_;
    std::size_t nextBytes_;
};

} // namespace Kestrel
