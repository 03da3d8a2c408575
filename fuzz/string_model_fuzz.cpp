// Sequences of operations on each of the eight strings against the same ones on a std::basic_string, whose members do
// all the work and know no encoding.
//
// Input: a byte for the string, then for each operation a byte for its kind, one for a place, one for a count, one for
// the length of a text, and the text: one byte for each unit.
#include <fuzzing.h>

#include <kvt/string/ustring.h>

#include <stdexcept>
#include <string>

using namespace kvt::fuzz;
using kvt::ex::UString;
using kvt::ex::UStringView;

namespace {

template <std::uint32_t N>
using Units = std::basic_string<typename UString<N>::value_type>;

/// Units of few kinds, so that what is looked for is found: one of them takes all bits.
template <std::uint32_t N>
Units<N> takeText(Input& input, std::size_t length) {
    using Unit = typename UString<N>::value_type;
    Units<N> text;
    for (std::size_t i = 0; i < length; ++i) {
        const unsigned byte = input.byte();
        text += byte % 8 == 7 ? static_cast<Unit>(-1) : static_cast<Unit>('a' + byte % 4);
    }
    return text;
}

template <typename Text>
void replaceAllSlowly(Text& text, const Text& from, const Text& to) {
    for (std::size_t at = 0; !from.empty() && (at = text.find(from, at)) != Text::npos; at += to.size()) {
        text.replace(at, from.size(), to);
    }
}

/// Runs both; a place beyond the end is the same failure to both.
template <typename First, typename Second>
void same(First first, Second second, const char* name) {
    bool firstFailed = false;
    bool secondFailed = false;
    try {
        first();
    } catch (const std::out_of_range&) {
        firstFailed = true;
    }
    try {
        second();
    } catch (const std::out_of_range&) {
        secondFailed = true;
    }
    require(firstFailed == secondFailed, std::string(name) + " fails for one of the two");
}

template <std::uint32_t N>
void run(Input& input) {
    using Unit = typename UString<N>::value_type;
    UString<N> string;
    Units<N> model;
    while (!input.rest().empty() && model.size() < 4096) {
        const unsigned kind = input.byte() % 14;
        const std::size_t place = input.byte() % (model.size() + 2);
        const std::size_t count = input.byte();
        const Units<N> text = takeText<N>(input, input.byte() % 24);
        const UStringView<N> view(text.data(), text.size());
        const Unit unit = text.empty() ? Unit('a') : text.front();
        switch (kind) {
        case 0:
            string.append(view);
            model.append(text);
            break;
        case 1:
            string.prepend(view);
            model.insert(0, text);
            break;
        case 2:
            same([&] { string.insert(place, view); }, [&] { model.insert(place, text); }, "insert");
            break;
        case 3:
            same([&] { string.erase(place, count); }, [&] { model.erase(place, count); }, "erase");
            break;
        case 4:
            same([&] { string.replace(place, count, view); }, [&] { model.replace(place, count, text); },
                 "replace");
            break;
        case 5:
            string.push_back(unit);
            model.push_back(unit);
            break;
        case 6:
            string.resize(count, unit);
            model.resize(count, unit);
            break;
        case 7: {
            const Units<N> to = takeText<N>(input, count % 4);
            if (!text.empty()) { // an empty one stands everywhere, for ever
                string.replaceAll(view, UStringView<N>(to.data(), to.size()));
                replaceAllSlowly(model, text, to);
            }
            break;
        }
        case 8: {
            const UString<N> sum = string + string;
            require(sum.size() == 2 * model.size(), "a sum of another size");
            break;
        }
        case 9: {
            const UStringView<N> part = string.substr(place, count);
            const Units<N> expected = place > model.size() ? Units<N>() : model.substr(place, count);
            require(Units<N>(part.data(), part.size()) == expected, "substr differs");
            break;
        }
        case 10:
            require(string.find(view, place) == model.find(text, place), "find differs");
            require(string.find(unit, place) == model.find(unit, place), "find of a unit differs");
            break;
        case 11:
            require(string.rfind(view, place) == model.rfind(text, place), "rfind differs");
            require(string.rfind(unit, place) == model.rfind(unit, place), "rfind of a unit differs");
            break;
        case 12:
            require(string.beginsWith(view) == (model.compare(0, text.size(), text) == 0),
                    "beginsWith differs");
            require(string.contains(view) == (model.find(text) != Units<N>::npos), "contains differs");
            break;
        default:
            string = UString<N>(string);
            string.append(string.substr(place, count));
            model += place > model.size() ? Units<N>() : model.substr(place, count);
            break;
        }
        require(Units<N>(string.begin(), string.end()) == model,
                "another text after operation " + std::to_string(kind));
        require(string.rawData()[string.size()] == 0, "no zero behind the text");
    }
}

constexpr void (*runs[])(Input&) = {run<0>, run<1>, run<2>, run<3>, run<27>, run<28>, run<29>, run<30>};

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    input.pick(runs)(input);
    return 0;
}
