// SPDX-License-Identifier: Apache-2.0
//
// What others put beside a database, in the place of its journal.
#include "Fixture.h"

#include <filesystem>
#include <numeric>

#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

namespace {

using Sqlite::Database;
using Sqlite::ErrorKind;
using Sqlite::Mode;

constexpr std::size_t pageBytes = 4096;
constexpr std::size_t sectorBytes = 512;
constexpr char const *journalMagic = "\xd9\xd5\x05\xf9\x20\xa1\x63\xd7";

std::string bigEndian(std::size_t value) {
    std::string bytes;
    for (int shift = 24; shift >= 0; shift -= 8) {
        bytes += static_cast<char>((value >> shift) & 0xff);
    }
    return bytes;
}

/// A journal that takes nothing back and asks for a file to be removed once it is done.
std::string journalThatNames(std::string const &victim, std::size_t pages) {
    std::string const magic(journalMagic, 8);
    std::string head =
        magic + bigEndian(0) + bigEndian(1) + bigEndian(pages) + bigEndian(sectorBytes) + bigEndian(pageBytes);
    head.resize(sectorBytes, '\0');
    auto const sum = std::accumulate(victim.begin(), victim.end(), std::size_t{0}, [](std::size_t all, char letter) {
        return all + static_cast<unsigned char>(letter);
    });
    return head + bigEndian((1U << 30) / pageBytes + 1) + victim + bigEndian(victim.size()) + bigEndian(sum) + magic;
}

class JournalTest : public SqliteTest, public ::testing::WithParamInterface<Mode> {
protected:
    JournalTest()
        : database_(makeFile("a.db", 3))
        , journal_(database_ + "-journal")
        , bytes_(bytesOf(database_)) {}

    std::optional<Sqlite::Error> errorOfOpening() const {
        return errorOf([this] { Database(database_, kind(), GetParam()); });
    }
    /// Opening fails and names the file and the reason; what is there stays.
    void expectRefusal(std::string const &reason) const {
        auto const error = errorOfOpening();
        ASSERT_TRUE(error);
        EXPECT_EQ(error->kind(), ErrorKind::Io);
        EXPECT_EQ(error->sentence(), "the test file '" + database_ + "' cannot be used: " + reason);
        EXPECT_EQ(bytesOf(database_), bytes_);
    }

    std::string database_;
    std::string journal_;
    std::string bytes_;
};

constexpr char const *noFile = "what lies beside it in the place of its journal is no regular file";

TEST_P(JournalTest, fault_52_AJournalRemovesNoOtherFile) {
    writeBytes(at("victim"), "precious");
    writeBytes(journal_, journalThatNames(at("victim"), bytes_.size() / pageBytes));
    expectRefusal("the journal beside it named another file to remove, as none of ours does; that file was left alone");
    EXPECT_EQ(bytesOf(at("victim")), "precious");
    // What the journal took back is taken back, and it is gone.
    EXPECT_FALSE(errorOfOpening());
    EXPECT_FALSE(exists(journal_));
}

TEST_P(JournalTest, fault_52_APipeInItsPlaceIsRefusedAtOnce) {
    ASSERT_EQ(::mkfifo(journal_.c_str(), 0600), 0);
    expectRefusal(noFile);
}

TEST_P(JournalTest, fault_52_ASocketInItsPlaceIsRefused) {
    std::filesystem::current_path(directory_); // a socket's path is short
    int const descriptor = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::string("a.db-journal").copy(address.sun_path, sizeof address.sun_path - 1);
    ASSERT_EQ(::bind(descriptor, reinterpret_cast<sockaddr const *>(&address), sizeof address), 0);
    ::close(descriptor);
    std::filesystem::current_path("/");
    expectRefusal(noFile);
}

TEST_P(JournalTest, fault_52_ADeviceInItsPlaceIsRefused) {
    if (::mknod(journal_.c_str(), S_IFCHR | 0600, (1U << 8) | 5U) != 0) { // zero
        GTEST_SKIP() << "only root makes devices";
    }
    expectRefusal(noFile);
}

TEST_P(JournalTest, fault_52_ADirectoryOrALinkInItsPlaceIsRefused) {
    std::filesystem::create_directory(journal_);
    expectRefusal(noFile);
    std::filesystem::remove(journal_);
    writeBytes(at("elsewhere"), std::string("\xd9", 1));
    std::filesystem::create_symlink(at("elsewhere"), journal_);
    expectRefusal(noFile);
}

TEST_P(JournalTest, fault_52_APipeInThePlaceOfTheFileIsRefused) {
    std::filesystem::remove(database_);
    ASSERT_EQ(::mkfifo(database_.c_str(), 0600), 0);
    auto const error = errorOfOpening();
    ASSERT_TRUE(error);
    EXPECT_EQ(error->kind(), ErrorKind::Io);
    EXPECT_EQ(error->sentence(), "the test file '" + database_ + "' cannot be opened: it is no regular file");
}

TEST_P(JournalTest, fault_52_APipeInThePlaceOfAWriteAheadLogIsRefused) {
    plainSql(database_, "PRAGMA journal_mode=WAL");
    for (char const *suffix : {"-wal", "-shm"}) {
        std::filesystem::remove(database_ + "-wal");
        std::filesystem::remove(database_ + "-shm");
        ASSERT_EQ(::mkfifo((database_ + suffix).c_str(), 0600), 0);
        EXPECT_TRUE(errorOfOpening()) << suffix;
    }
}

INSTANTIATE_TEST_SUITE_P(Modes, JournalTest, ::testing::Values(Mode::Create, Mode::ReadWrite, Mode::QueryOnly));

} // namespace
