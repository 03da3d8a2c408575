// The library beside what users would pick instead, each work as that library is meant to be used. It has to be ahead
// of them, but for what compiles a pattern to machine code and for {fmt}, which are shown. The texts are UTF-8 of 1
// MiB, unless a row says otherwise; each call makes its result afresh.
#include "limits.h"
#include "texts.h"

#include <kvt/kvt.h>

#include <absl/strings/str_split.h>
#include <boost/algorithm/string/split.hpp>
#include <boost/container/deque.hpp>
#include <boost/locale.hpp>
#include <date/date.h>
#include <fmt/format.h>
#include <glib.h>
#include <lmdb.h>
#include <QString>
#include <re2/re2.h>
#include <unicode/ustring.h>

#define PCRE2_CODE_UNIT_WIDTH 8
#include <pcre2.h>

#include <cstdint>
#include <cstring>
#include <filesystem>
#include <memory>
#include <numeric>
#include <sstream>
#include <stdexcept>
#include <string>
#include <unistd.h>
#include <vector>

namespace {

using namespace kvt::ex;
using kvt::bench::Bound;
using kvt::bench::Limits;
using kvt::bench::Text;
using kvt::bench::way;
using kvt::bench::Way;

constexpr std::size_t mebibyte = 1 << 20;

UString<0> string(const std::string& text) {
    return UString<0>(UStringView<0>(text));
}

/// Memory of GLib's as what a call gives.
struct GFree {
    void operator()(void* memory) const { g_free(memory); }
};
template <typename T>
using GMemory = std::unique_ptr<T, GFree>;

class Peers {
public:
    Peers(Limits& limits, std::string work, Way way) : limits_(limits), work_(std::move(work)) {
        limits_.add(work_, std::move(way));
    }
    /// One that the library has to be ahead of, or one that is only shown.
    Peers& add(const std::string& name, Way way, Bound bound = Bound::atLeast) {
        limits_.add(work_ + ": " + name, std::move(way));
        limits_.hold({work_, work_ + ": " + name, bound, 1});
        return *this;
    }

private:
    Limits& limits_;
    std::string work_;
};

// ---- Conversion

void holdConversions(Limits& limits, const Text& row) {
    const std::string text = kvt::bench::shuffled(row.sentence, mebibyte);
    Peers(limits, std::string("UTF-8 to UTF-16, ") + row.name,
          way([source = string(text)] { return UString<2>(source); }))
        .add("Qt",
             way([text] { return QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size())); }))
        .add("GLib", way([text] {
                 return GMemory<gunichar2>(g_utf8_to_utf16(text.data(), static_cast<glong>(text.size()),
                                                           nullptr, nullptr, nullptr));
             }))
        .add("u_strFromUTF8", way([text] {
                 std::u16string units(text.size(), u'\0');
                 std::int32_t size = 0;
                 UErrorCode status = U_ZERO_ERROR;
                 u_strFromUTF8(units.data(), static_cast<std::int32_t>(units.size()), &size, text.data(),
                               static_cast<std::int32_t>(text.size()), &status);
                 units.resize(static_cast<std::size_t>(size));
                 return units;
             }));
    const UString<2> units(string(text));
    const QString qString = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
    Peers(limits, std::string("UTF-16 to UTF-8, ") + row.name, way([units] { return UString<0>(units); }))
        .add("Qt", way([qString] { return qString.toUtf8(); }))
        .add("GLib", way([units] {
                 return GMemory<char>(g_utf16_to_utf8(reinterpret_cast<const gunichar2*>(units.rawData()),
                                                      static_cast<glong>(units.size()), nullptr, nullptr,
                                                      nullptr));
             }))
        .add("u_strToUTF8", way([units] {
                 std::string bytes(units.size() * 3, '\0');
                 std::int32_t size = 0;
                 UErrorCode status = U_ZERO_ERROR;
                 u_strToUTF8(bytes.data(), static_cast<std::int32_t>(bytes.size()), &size, units.rawData(),
                             static_cast<std::int32_t>(units.size()), &status);
                 bytes.resize(static_cast<std::size_t>(size));
                 return bytes;
             }));
}

// ---- Case, pieces, places

void holdCase(Limits& limits, const Text& row) {
    const std::string text = kvt::bench::shuffled(row.sentence, mebibyte);
    const std::locale locale = boost::locale::generator()("en_US.UTF-8");
    const QString qString = QString::fromUtf8(text.data(), static_cast<qsizetype>(text.size()));
    const auto size = static_cast<gssize>(text.size());
    Peers(limits, std::string("fold, ") + row.name,
          way([source = string(text)] { return source.getAsFoldedCase(); }))
        .add("Boost.Locale", way([text, locale] { return boost::locale::fold_case(text, locale); }))
        .add("GLib", way([text, size] { return GMemory<char>(g_utf8_casefold(text.data(), size)); }))
        .add("Qt", way([qString] { return qString.toCaseFolded(); }));
    Peers(limits, std::string("upper, ") + row.name,
          way([source = string(text)] { return source.getAsUpperCase(); }))
        .add("Boost.Locale", way([text, locale] { return boost::locale::to_upper(text, locale); }))
        .add("GLib", way([text, size] { return GMemory<char>(g_utf8_strup(text.data(), size)); }))
        .add("Qt", way([qString] { return qString.toUpper(); }));
}

void holdSplit(Limits& limits, std::size_t length) {
    const std::string text = kvt::bench::fields(length, mebibyte);
    Peers(limits, "split, fields of " + std::to_string(length),
          way([source = string(text)] { return source.split(','); }))
        .add("Abseil", way([text] {
                 const std::vector<std::string> pieces = absl::StrSplit(text, ',');
                 return pieces;
             }))
        .add("Boost", way([text] {
                 std::vector<std::string> pieces;
                 boost::split(pieces, text, [](char c) { return c == ','; });
                 return pieces;
             }));
}

void holdFind(Limits& limits) {
    const std::string text = kvt::bench::prose(mebibyte) + "animal kingdom";
    const std::string needle = "animal kingdom";
    Peers(limits, "find, frequent first byte",
          way([source = string(text), needle = string(needle)] { return source.find(needle); }))
        .add("memmem", way([text, needle] {
                 return ::memmem(text.data(), text.size(), needle.data(), needle.size());
             }));
}

// ---- Regular expressions

class Pcre2 {
public:
    explicit Pcre2(const std::string& pattern) {
        int error = 0;
        PCRE2_SIZE place = 0;
        code_.reset(pcre2_compile(reinterpret_cast<PCRE2_SPTR>(pattern.data()), pattern.size(), 0, &error,
                                  &place, nullptr),
                    pcre2_code_free);
        if (!code_) {
            throw std::runtime_error(pattern);
        }
        pcre2_jit_compile(code_.get(), PCRE2_JIT_COMPLETE);
        match_.reset(pcre2_match_data_create_from_pattern(code_.get(), nullptr), pcre2_match_data_free);
    }
    int search(const std::string& text) const {
        return pcre2_match(code_.get(), reinterpret_cast<PCRE2_SPTR>(text.data()), text.size(), 0, 0,
                           match_.get(), nullptr);
    }

private:
    std::shared_ptr<pcre2_code> code_;
    std::shared_ptr<pcre2_match_data> match_;
};

void holdSearch(Limits& limits, const std::string& name, const std::string& pattern,
                const std::string& text) {
    Peers(limits, "search, " + name, way([regex = URegex<0>(string(pattern)), source = string(text)] {
              return static_cast<bool>(regex.search(source));
          }))
        .add("RE2",
             way([regex = std::make_shared<RE2>(pattern), text] { return RE2::PartialMatch(text, *regex); }))
        .add("PCRE2 with its compiler", way([regex = Pcre2(pattern), text] { return regex.search(text); }),
             Bound::shown);
}

// ---- Dates and numbers

void holdDates(Limits& limits) {
    Peers(limits, "date to text", way([value = string("20200102"), pattern = string("%Y-%m-%d")] {
              return datetime::format(value, pattern);
          }))
        .add("the date library",
             way([day = date::sys_days(date::year(2020) / 1 / 2)] { return date::format("%Y-%m-%d", day); }))
        .add("{fmt}", way([] { return fmt::format("{:04}-{:02}-{:02}", 2020, 1, 2); }));
    Peers(limits, "text to date", way([value = string("2020-01-02"), pattern = string("%Y-%m-%d")] {
              return datetime::parse(value, pattern, false);
          }))
        .add("the date library", way([] {
                 std::istringstream stream("2020-01-02");
                 date::sys_days day;
                 stream >> date::parse("%Y-%m-%d", day);
                 return day;
             }));
    Peers(limits, "double to text", way([] {
              char digits[32];
              double number = 20731.6180339887;
              benchmark::DoNotOptimize(number);
              return std::string(digits, double_to_string(number, digits));
          }))
        .add("{fmt}", way([] {
                 double number = 20731.6180339887;
                 benchmark::DoNotOptimize(number);
                 return fmt::format("{}", number);
             }),
             Bound::shown);
}

// ---- Data in a file

constexpr std::uint64_t keptWords = 100'000;

/// A file for the time of the program.
std::string scratchFile(const std::string& name) {
    return (std::filesystem::temp_directory_path() / ("kvt_bench_" + name + std::to_string(::getpid())))
        .string();
}

/// Words in a deque in a segment.
class Segment {
public:
    Segment() { segment_.load(false); }
    std::uint64_t fillAndSum() {
        boost::container::deque<std::uint64_t, mmap::segment_allocator<std::uint64_t>> words(
            segment_.segment_manager());
        for (std::uint64_t i = 0; i < keptWords; ++i) {
            words.push_back(i);
        }
        return std::accumulate(words.begin(), words.end(), std::uint64_t{0});
    }

private:
    mmap::memory_manager manager_{scratchFile("segment"), {}};
    mmap::mapped_region_segment segment_ = manager_.create_segment();
};

/// Words under ascending numbers in LMDB, as fast as it goes: in one transaction that does not wait for the disk.
class Lmdb {
public:
    Lmdb() {
        check(mdb_env_create(&environment_));
        check(mdb_env_set_mapsize(environment_, 64 << 20));
        check(mdb_env_open(environment_, path_.c_str(), MDB_NOSUBDIR | MDB_WRITEMAP | MDB_NOSYNC | MDB_NOLOCK,
                           0600));
    }
    Lmdb(const Lmdb&) = delete;
    Lmdb& operator=(const Lmdb&) = delete;
    ~Lmdb() {
        mdb_env_close(environment_);
        std::filesystem::remove(path_);
    }
    std::uint64_t fillAndSum() {
        MDB_txn* transaction = nullptr;
        MDB_dbi table = 0;
        check(mdb_txn_begin(environment_, nullptr, 0, &transaction));
        check(mdb_dbi_open(transaction, nullptr, MDB_INTEGERKEY, &table));
        check(mdb_drop(transaction, table, 0));
        for (std::uint64_t i = 0; i < keptWords; ++i) {
            MDB_val key{sizeof i, &i};
            MDB_val value{sizeof i, &i};
            check(mdb_put(transaction, table, &key, &value, MDB_APPEND));
        }
        check(mdb_txn_commit(transaction));
        check(mdb_txn_begin(environment_, nullptr, MDB_RDONLY, &transaction));
        MDB_cursor* cursor = nullptr;
        check(mdb_cursor_open(transaction, table, &cursor));
        std::uint64_t sum = 0;
        MDB_val key{};
        MDB_val value{};
        while (mdb_cursor_get(cursor, &key, &value, MDB_NEXT) == 0) {
            std::uint64_t word = 0;
            std::memcpy(&word, value.mv_data, sizeof word);
            sum += word;
        }
        mdb_cursor_close(cursor);
        mdb_txn_abort(transaction);
        return sum;
    }

private:
    static void check(int error) {
        if (error != 0) {
            throw std::runtime_error(mdb_strerror(error));
        }
    }

    std::string path_ = scratchFile("lmdb");
    MDB_env* environment_ = nullptr;
};

void holdFiles(Limits& limits) {
    Peers(limits, "100,000 words into a file, and read",
          way([segment = std::make_shared<Segment>()] { return segment->fillAndSum(); }))
        .add("LMDB", way([lmdb = std::make_shared<Lmdb>()] { return lmdb->fillAndSum(); }));
}

} // namespace

int main(int argc, char** argv) {
    Limits large(15, 4);
    for (const Text& text : {kvt::bench::ascii, kvt::bench::latin, kvt::bench::japanese}) {
        holdConversions(large, text);
        holdCase(large, text);
    }
    holdSplit(large, 8);
    holdSplit(large, 32);
    holdFind(large);
    holdSearch(large, "a date in 1 MiB of a log", "\\d{4}-\\d\\d-\\d\\d \\d\\d:\\d\\d",
               kvt::bench::logText(mebibyte));
    holdSearch(large, "a literal in 1 MiB of a log", "ERROR \\[(\\w+)\\] (.*)",
               kvt::bench::logText(mebibyte));
    holdFiles(large);
    Limits small(101, 2'000);
    holdSearch(small, "no match in 90 bytes", "(\\d{4})-(\\d\\d)-(\\d\\d)", kvt::bench::prose(90));
    holdDates(small);
    const bool isLargeWithin = large.run(argc, argv) == 0;
    return small.run(argc, argv) == 0 && isLargeWithin ? 0 : 1;
}
