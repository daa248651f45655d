// SPDX-License-Identifier: Apache-2.0
//
// A long result through a format beside a writer written by hand that reads the same result, knows the places and types
// of its fields, and writes the same bytes.
//
//   bench_format json|table ROUNDS [ROWS]
//
// Prints how long each took in nanoseconds, the format first, one line a round.
#include <algorithm>
#include <array>
#include <charconv>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <fcntl.h>
#include <string>
#include <unistd.h>
#include <vector>

#include "plexa/Formatter.h"

namespace {

using namespace Plexa::MetaObj;

Plexa::Result rows(std::size_t count) {
    auto const schema = MetaStruct::New("Container");
    schema->SetField("Name", MetaString::New());
    schema->SetField("Id", MetaString::New());
    schema->SetField("Size (MB)", MetaInt::New());
    schema->SetField("URL", MetaString::New());
    schema->SetField("Ready", MetaBool::New());
    auto const list = MetaList::New(StructList, schema);
    for (std::size_t i = 0; i < count; ++i) {
        std::string const digits = std::to_string(i);
        auto const row = MetaStruct::New("Container");
        row->SetField("Name", "container-" + digits);
        row->SetField("Id", "3f1a52de-6c1b-4b57-9a0e-" + std::string(12 - digits.size(), '0') + digits);
        row->SetField("Size (MB)", static_cast<int64_t>(i * 4096));
        row->SetField("URL", "https://array.example:8443/orka");
        row->SetField("Ready", i % 3 == 0);
        list->Append(row);
    }
    return {list, MetaList::New(StructList, schema)};
}

/// Drops what it gets, by a write to nowhere.
class Nowhere : public Plexa::Sink {
public:
    void write(std::string_view text) override {
        static_cast<void>(::write(descriptor_, text.data(), text.size()) == 0);
    }

private:
    int descriptor_ = open("/dev/null", O_WRONLY);
};

std::string_view text(MetaStruct const &row, std::size_t field) {
    return static_cast<MetaString const &>(*row.ViewFields().value(field)).ViewValue();
}

int64_t number(MetaStruct const &row, std::size_t field) {
    return static_cast<MetaInt const &>(*row.ViewFields().value(field)).GetValue();
}

bool truth(MetaStruct const &row, std::size_t field) {
    return static_cast<MetaBool const &>(*row.ViewFields().value(field)).GetValue();
}

/// What a careful hand writes: a buffer, handed on when it is full.
class Hand {
public:
    explicit Hand(Plexa::Sink &sink)
        : sink_(sink) {
        buffer_.reserve(2 * full);
    }
    ~Hand() {
        sink_.write(buffer_);
    }
    Hand(Hand const &) = delete;
    Hand &operator=(Hand const &) = delete;

    void json(Plexa::Result const &result) {
        buffer_ += "[";
        bool first = true;
        for (auto const &element : static_cast<MetaList const &>(*result.value).ViewElements()) {
            auto const &row = static_cast<MetaStruct const &>(*element);
            buffer_ += first ? "\n  {\n    \"Name\": " : ",\n  {\n    \"Name\": ";
            first = false;
            jsonText(text(row, 0));
            buffer_ += ",\n    \"Id\": ";
            jsonText(text(row, 1));
            buffer_ += ",\n    \"Size (MB)\": ";
            digits(number(row, 2));
            buffer_ += ",\n    \"URL\": ";
            jsonText(text(row, 3));
            buffer_ += truth(row, 4) ? ",\n    \"Ready\": true\n  }" : ",\n    \"Ready\": false\n  }";
            drain();
        }
        buffer_ += "\n]\n";
    }

    void table(Plexa::Result const &result) {
        std::size_t name = 4;
        std::size_t id = 2;
        std::size_t size = 9;
        std::size_t url = 3;
        auto const &rows = static_cast<MetaList const &>(*result.value).ViewElements();
        for (auto const &element : rows) {
            auto const &row = static_cast<MetaStruct const &>(*element);
            name = std::max(name, width(text(row, 0)));
            id = std::max(id, width(text(row, 1)));
            size = std::max(size, std::to_string(number(row, 2)).size());
            url = std::max(url, width(text(row, 3)));
        }
        line("Name", name, "Id", id, "Size (MB)", size, "URL", url, "Ready");
        line(std::string(name, '-'), name, std::string(id, '-'), id, std::string(size, '-'), size,
             std::string(url, '-'), url, "-----");
        for (auto const &element : rows) {
            auto const &row = static_cast<MetaStruct const &>(*element);
            line(text(row, 0), name, text(row, 1), id, std::to_string(number(row, 2)), size, text(row, 3), url,
                 truth(row, 4) ? "true" : "false");
            drain();
        }
    }

private:
    static constexpr std::size_t full = 16384;

    void drain() {
        if (buffer_.size() >= full) {
            sink_.write(buffer_);
            buffer_.clear();
        }
    }

    /// Texts of other bytes do not occur in these rows; finding that out is part of the work.
    static bool isHarmless(std::string_view text) {
        static std::array<bool, 256> const harmless = [] {
            std::array<bool, 256> table{};
            std::fill(table.begin() + ' ', table.begin() + '\x7F', true);
            table['"'] = table['\\'] = false;
            return table;
        }();
        return std::all_of(text.begin(), text.end(), [](char c) { return harmless[static_cast<unsigned char>(c)]; });
    }

    static std::size_t width(std::string_view text) {
        if (!isHarmless(text)) {
            std::abort();
        }
        return text.size();
    }

    void jsonText(std::string_view text) {
        if (!isHarmless(text)) {
            std::abort();
        }
        buffer_ += '"';
        buffer_ += text;
        buffer_ += '"';
    }

    void digits(int64_t value) {
        char text[24];
        buffer_.append(text, std::to_chars(text, text + sizeof(text), value).ptr);
    }

    void line(std::string_view name, std::size_t nameWidth, std::string_view id, std::size_t idWidth,
              std::string_view size, std::size_t sizeWidth, std::string_view url, std::size_t urlWidth,
              char const *ready) {
        buffer_ += name;
        buffer_.append(nameWidth - width(name) + 2, ' ');
        buffer_ += id;
        buffer_.append(idWidth - width(id) + 2 + sizeWidth - size.size(), ' ');
        buffer_ += size;
        buffer_ += "  ";
        buffer_ += url;
        buffer_.append(urlWidth - width(url) + 2, ' ');
        buffer_ += ready;
        buffer_ += '\n';
    }

    Plexa::Sink &sink_;
    std::string buffer_;
};

/// Of this process's own time: no disk and no peer is waited for, and what else the machine does is not measured.
template <typename Work>
int64_t nanoseconds(Work const &work) {
    auto const now = [] {
        timespec time{};
        clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
        return int64_t{time.tv_sec} * 1000000000 + time.tv_nsec;
    };
    int64_t const start = now();
    work();
    return now() - start;
}

} // namespace

int main(int argc, char **argv) {
    if (argc < 3) {
        std::fputs("usage: bench_format json|table ROUNDS [ROWS]\n", stderr);
        return 2;
    }
    std::string const name = argv[1];
    Plexa::Result const result = rows(argc > 3 ? static_cast<std::size_t>(std::atol(argv[3])) : 100000);
    Plexa::Format const &format = Plexa::requireFormat(name, "bench_format");
    auto const byFormat = [&](Plexa::Sink &sink) { format.write(result, {}, sink); };
    auto const byHand = [&](Plexa::Sink &sink) {
        Hand hand(sink);
        name == "json" ? hand.json(result) : hand.table(result);
    };

    Plexa::StringSink ours;
    Plexa::StringSink floor;
    byFormat(ours);
    byHand(floor);
    if (ours.text() != floor.text()) {
        std::fputs("bench_format: the two write different bytes\n", stderr);
        return 1;
    }
    Nowhere nowhere;
    for (long left = std::atol(argv[2]); left > 0; --left) {
        int64_t const formatted = nanoseconds([&] { byFormat(nowhere); });
        std::printf("%lld %lld\n", static_cast<long long>(formatted),
                    static_cast<long long>(nanoseconds([&] { byHand(nowhere); })));
    }
    return 0;
}
