// Strings of each type made from bytes in any encoding, against ICU alone; and from each of them to all others,
// which must end in a string or in one of the stated failures, whatever the bytes are.
//
// Input: encoding, what is checked, then the bytes. The replay checks everything on each input. libFuzzer, which counts
// its runs, checks one thing in each: nearly all of the time goes into failures, and there are a hundred for one input
// of noise.
#include <fuzzing.h>
#include <reference/wwjd_reference.h>
#include <support/outcome.h>

#include <kvt/string/ustring.h>

#include <stdexcept>

using namespace kvt::ex;
using namespace kvt::fuzz;
using kvt::test::Outcome;

namespace {

template <std::uint32_t N>
std::string bytesOf(const UString<N>& string) {
    return {reinterpret_cast<const char*>(string.rawData()),
            string.size() * sizeof(typename UString<N>::value_type)};
}

/// A failed construction leaves no string behind, so that only the failure can be compared.
template <std::uint32_t N>
Outcome construct(std::string_view bytes, const std::string& from) {
    std::string made;
    Outcome outcome =
        kvt::test::outcomeOf([&] { made = bytesOf(UString<N>(bytes.data(), bytes.size(), Encoding(from))); });
    outcome.bytes = made;
    return outcome;
}

Outcome expected(const std::string& from, const std::string& to, std::string_view bytes) {
    if (from == to && to.starts_with("UTF-16")) {
        bytes.remove_suffix(bytes.size() % 2);
    }
    if (from == to && to.starts_with("UTF-32")) {
        bytes.remove_suffix(bytes.size() % 4);
    }
    Outcome outcome = kvt::test::expectedAssign(from, to, bytes);
    if (outcome.number != 0) {
        outcome.bytes.clear();
    }
    return outcome;
}

template <std::uint32_t N>
void checkConstruction(const std::string& from, const std::string& to, std::string_view bytes) {
    requireEqual(construct<N>(bytes, from), expected(from, to, bytes), "UString<", N, "> from ", from, " ",
                 Hex{bytes});
}

void checkWwjd(const std::string& from, std::string_view bytes) {
    const Outcome utf16 = expected(from, "UTF-16LE", bytes);
    const Outcome outcome = construct<29>(bytes, from);
    requireEqual(outcome.number, utf16.number, "UString<29> from ", from, " ", Hex{bytes});
    if (utf16.number == 0) {
        std::u16string units(utf16.bytes.size() / 2, u'\0');
        utf16.bytes.copy(reinterpret_cast<char*>(units.data()), units.size() * 2);
        requireEqual(outcome.bytes, kvt::test::reference::wwjdEncoded(units), "UString<29> from ", from);
    }
}

/// Whatever a string holds, a conversion gives a string or a failure of its own kind.
template <std::uint32_t N, std::uint32_t M>
void convertTo(const UString<N>& source) {
    try {
        UString<M> target(source);
        target.assign(source);
        require(target.rawData()[target.size()] == 0, "no zero behind the text");
    } catch (const Throwable& failure) {
        require(!failure.what().isEmpty(), "a failure without contents");
    } catch (const std::invalid_argument&) {
        require(N == 29 || (N == 30 && source.encoding() == Encoding(Encoding::Wwjd)),
                "a number outside of wwjd");
    }
}

template <std::uint32_t N>
void convertToAll(const UString<N>& source) {
    convertTo<N, 0>(source);
    convertTo<N, 1>(source);
    convertTo<N, 2>(source);
    convertTo<N, 3>(source);
    convertTo<N, 27>(source);
    convertTo<N, 28>(source);
    convertTo<N, 29>(source);
    convertTo<N, 30>(source);
}

template <std::uint32_t N>
void convertBytesLabelled(const std::string&, std::string_view bytes) {
    convertToAll(UString<N>(bytes.data(), bytes.size(), static_cast<Encoding::Type>(N)));
}

using Check = void (*)(const std::string& from, std::string_view bytes);

constexpr Check checks[] = {
    [](const std::string& from, std::string_view bytes) { checkConstruction<0>(from, "UTF-8", bytes); },
    [](const std::string& from, std::string_view bytes) { checkConstruction<1>(from, "US-ASCII", bytes); },
    [](const std::string& from, std::string_view bytes) { checkConstruction<2>(from, "UTF-16LE", bytes); },
    [](const std::string& from, std::string_view bytes) { checkConstruction<3>(from, "UTF-32LE", bytes); },
    [](const std::string& from, std::string_view bytes) {
        checkConstruction<27>(from, std::string(Encoding(Encoding::System).getName()), bytes);
    },
    checkWwjd,
    [](const std::string& from, std::string_view bytes) {
        requireEqual(construct<28>(bytes, from), (Outcome{std::string(bytes), 0, {}, {}}), "UString<28>");
        requireEqual(construct<30>(bytes, from), (Outcome{std::string(bytes), 0, {}, {}}), "UString<30>");
    },
    convertBytesLabelled<0>,
    convertBytesLabelled<1>,
    convertBytesLabelled<2>,
    convertBytesLabelled<3>,
    convertBytesLabelled<27>,
    convertBytesLabelled<28>,
    convertBytesLabelled<29>,
    convertBytesLabelled<30>,
    [](const std::string& from, std::string_view bytes) {
        convertToAll(UString<30>(bytes.data(), bytes.size(), Encoding(from)));
    },
    [](const std::string&, std::string_view bytes) {
        convertToAll(UString<30>(bytes.data(), bytes.size(), Encoding::Wwjd));
    },
};

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const std::string from = input.pick(encodings);
    const Check chosen = input.pick(checks);
    const std::string_view bytes = input.rest();
#ifdef KVT_REPLAY
    static_cast<void>(chosen);
    for (const Check check : checks) {
        check(from, bytes);
    }
#else
    chosen(from, bytes);
#endif
    return 0;
}
