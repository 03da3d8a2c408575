// Search and replacement beside the standard library's strings of the same unit, on the same texts.
//
// Each benchmark runs on prose, where the first unit of a needle is frequent and the needle is not, and each reports the
// units that it went over in a second. The size of the text in units is the argument.
#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>

#include <benchmark/benchmark.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace {

using kvt::ex::UString;
using kvt::ex::UStringView;

template <typename Unit>
std::basic_string<Unit> units(std::string_view ascii) {
    return std::basic_string<Unit>(ascii.begin(), ascii.end());
}

/// Sentences without "q" and "zebra".
template <typename Unit>
std::basic_string<Unit> prose(std::size_t size) {
    const std::string_view sentence =
        "the lazy dog and the other animals looked on, zealous and amazed, as the fox came; ";
    std::basic_string<Unit> text;
    while (text.size() < size) {
        text += units<Unit>(sentence);
    }
    text.resize(size, Unit{'.'});
    return text;
}

template <std::uint32_t N>
struct Kvt {
    using Unit = typename UString<N>::value_type;
    using Text = UString<N>;
    using Set = kvt::ex::vector<Unit>;
    static Text text(const std::basic_string<Unit>& units) { return Text(UStringView<N>(units)); }
    static Set set(const std::basic_string<Unit>& units) { return Set(units.begin(), units.end()); }
    static std::size_t firstOf(const Text& text, const Set& set) { return text.findFirstOf(set); }
    static int compare(const Text& left, const Text& right) { return left.compare(right); }
    static void replaceAll(Text& text, const Text& from, const Text& to) { text.replaceAll(from, to); }
};

template <typename CharT>
struct Standard {
    using Unit = CharT;
    using Text = std::basic_string<Unit>;
    using Set = Text;
    static Text text(const std::basic_string<Unit>& units) { return units; }
    static Set set(const std::basic_string<Unit>& units) { return units; }
    static std::size_t firstOf(const Text& text, const Set& set) { return text.find_first_of(set); }
    static int compare(const Text& left, const Text& right) { return left.compare(right); }
    // What is usually written in place of a replaceAll(); the tail moves at each replacement that changes the length.
    static void replaceAll(Text& text, const Text& from, const Text& to) {
        for (std::size_t pos = 0; (pos = text.find(from, pos)) != Text::npos; pos += to.size()) {
            text.replace(pos, from.size(), to);
        }
    }
};

template <typename Kind, typename Action>
void overText(benchmark::State& state, const char* needle, Action action) {
    const auto size = static_cast<std::size_t>(state.range(0));
    const typename Kind::Text text = Kind::text(prose<typename Kind::Unit>(size));
    const typename Kind::Text sought = Kind::text(units<typename Kind::Unit>(needle));
    for (auto _ : state) {
        benchmark::DoNotOptimize(action(text, sought));
    }
    state.counters["units"] =
        benchmark::Counter(static_cast<double>(size), benchmark::Counter::kIsIterationInvariantRate);
}

// The first unit stands nowhere.
template <typename Kind>
void findRare(benchmark::State& state) {
    overText<Kind>(state, "quick", [](const auto& text, const auto& needle) { return text.find(needle); });
}

// The first unit stands in each word or so.
template <typename Kind>
void findFrequent(benchmark::State& state) {
    overText<Kind>(state, "animal kingdom",
                   [](const auto& text, const auto& needle) { return text.find(needle); });
}

template <typename Kind>
void findUnit(benchmark::State& state) {
    overText<Kind>(state, "q", [](const auto& text, const auto& needle) { return text.find(needle[0]); });
}

template <typename Kind>
void rfindRare(benchmark::State& state) {
    overText<Kind>(state, "quick", [](const auto& text, const auto& needle) { return text.rfind(needle); });
}

template <typename Kind>
void rfindFrequent(benchmark::State& state) {
    overText<Kind>(state, "animal kingdom",
                   [](const auto& text, const auto& needle) { return text.rfind(needle); });
}

template <typename Kind>
void rfindUnit(benchmark::State& state) {
    overText<Kind>(state, "q", [](const auto& text, const auto& needle) { return text.rfind(needle[0]); });
}

template <typename Kind>
void findFirstOf(benchmark::State& state) {
    const auto set = Kind::set(units<typename Kind::Unit>("QZ!?"));
    overText<Kind>(state, "", [&](const auto& text, const auto&) { return Kind::firstOf(text, set); });
}

template <typename Kind>
void compareEqual(benchmark::State& state) {
    const auto other = Kind::text(prose<typename Kind::Unit>(static_cast<std::size_t>(state.range(0))));
    overText<Kind>(state, "", [&](const auto& text, const auto&) { return Kind::compare(text, other); });
}

template <typename Kind>
void replaceAllGrowing(benchmark::State& state) {
    const auto to = Kind::text(units<typename Kind::Unit>("creatures"));
    overText<Kind>(state, "animals", [&](const auto& text, const auto& from) {
        auto copy = text;
        Kind::replaceAll(copy, from, to);
        return copy.size();
    });
}

template <typename Kind>
void replaceAllOfOneSize(benchmark::State& state) {
    const auto to = Kind::text(units<typename Kind::Unit>("insects"));
    overText<Kind>(state, "animals", [&](const auto& text, const auto& from) {
        auto copy = text;
        Kind::replaceAll(copy, from, to);
        return copy.size();
    });
}

template <typename Kind>
void replaceAllOfNone(benchmark::State& state) {
    overText<Kind>(state, "quick", [](const auto& text, const auto& from) {
        auto copy = text;
        Kind::replaceAll(copy, from, from);
        return copy.size();
    });
}

#define KVT_BENCH(name)                                                                                      \
    BENCHMARK_TEMPLATE(name, Kvt<0>)->Arg(24)->Arg(1000)->Arg(100000);                                       \
    BENCHMARK_TEMPLATE(name, Standard<char>)->Arg(24)->Arg(1000)->Arg(100000);                               \
    BENCHMARK_TEMPLATE(name, Kvt<2>)->Arg(24)->Arg(1000)->Arg(100000);                                       \
    BENCHMARK_TEMPLATE(name, Standard<char16_t>)->Arg(24)->Arg(1000)->Arg(100000);                           \
    BENCHMARK_TEMPLATE(name, Kvt<3>)->Arg(24)->Arg(1000)->Arg(100000);                                       \
    BENCHMARK_TEMPLATE(name, Standard<char32_t>)->Arg(24)->Arg(1000)->Arg(100000)

KVT_BENCH(findRare);
KVT_BENCH(findFrequent);
KVT_BENCH(findUnit);
KVT_BENCH(rfindRare);
KVT_BENCH(rfindFrequent);
KVT_BENCH(rfindUnit);
KVT_BENCH(findFirstOf);
KVT_BENCH(compareEqual);
KVT_BENCH(replaceAllGrowing);
KVT_BENCH(replaceAllOfOneSize);
KVT_BENCH(replaceAllOfNone);

} // namespace
