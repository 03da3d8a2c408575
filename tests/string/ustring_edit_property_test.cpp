// Editing against plain loops: every small text over two units with every position and count, and long random
// histories of edits on one object.
#include <string/naive_units.h>
#include <support/string_types.h>

#include <random>
#include <stdexcept>

namespace {

using namespace kvt::test;
using kvt::ex::detail::case_insensitive_t;

template <typename Number>
class UStringEditProperty : public StringTest<Number> {
public:
    using Base = StringTest<Number>;
    using typename Base::String;
    using typename Base::Unit;
    using typename Base::Units;
    using typename Base::View;
    using Naive = std::optional<Units>;

    static std::vector<std::uint64_t> positionsFor(std::size_t size) {
        std::vector<std::uint64_t> positions;
        for (std::uint64_t pos = 0; pos <= size + 2; ++pos) {
            positions.push_back(pos);
        }
        positions.insert(positions.end(), {std::uint64_t{1} << 63, npos - 1, npos});
        return positions;
    }

    static Units twoUnits() { return {Base::unit('a'), Base::highest}; }

    static View viewOf(const Units& text) { return View(text); }

    /// Runs `edit` on the string, which then is `expected`, or, where nothing is expected, has thrown that the
    /// position is none and left the text.
    template <typename Edit, typename Describe>
    static void expectEdit(const Units& text, const Naive& expected, Edit edit, Describe describe) {
        String string = Base::make(text);
        std::string thrown;
        try {
            edit(string);
        } catch (const std::out_of_range& failure) {
            thrown = failure.what();
        }
        ASSERT_EQ(thrown, expected ? "" : "invalid string position") << describe();
        const Units& wanted = expected ? *expected : text;
        ASSERT_TRUE(Base::textOf(string) == wanted)
            << describe() << " is " << shown(Base::textOf(string)) << " and not " << shown(wanted);
        ASSERT_EQ(string.rawData()[string.size()], Unit{0}) << describe();
    }

    static std::string rowOf(const Units& text, std::uint64_t pos, std::uint64_t count, const Units& with) {
        return shown(text) + ' ' + std::to_string(pos) + ' ' + std::to_string(count) + ' ' + shown(with);
    }

    /// How a replacement finds what it replaces.
    template <typename Tag>
    static auto finder(const Units& from, Tag tag) {
        return [from, tag](const Units& text, std::uint64_t pos) {
            if constexpr (std::is_same_v<Tag, case_insensitive_t> && Base::folds) {
                static_cast<void>(tag);
                return naive::find(Base::textOf(String::getAsFoldedCase(View(text))),
                                   Base::textOf(String::getAsFoldedCase(View(from))), pos);
            } else {
                static_cast<void>(tag);
                return naive::find(text, from, pos);
            }
        };
    }

    /// All three replacements of one text by another.
    template <typename Tag>
    static void replaceEach(const Units& text, const Units& from, const Units& to, Tag tag) {
        const auto describe = [&] { return shown(text) + ": " + shown(from) + " by " + shown(to); };
        const auto find = finder(from, tag);
        if (!from.empty()) {
            const Naive all = naive::replaceAll(text, from, to, find);
            expectEdit(
                text, all, [&](String& s) { s.replaceAll(viewOf(from), viewOf(to), tag); }, describe);
        }
        const Naive first = naive::replace(text, find(text, 0), from.size(), to);
        expectEdit(
            text, first, [&](String& s) { s.replaceFirst(viewOf(from), viewOf(to), tag); }, describe);
        std::uint64_t found = npos;
        for (std::uint64_t pos = find(text, 0); pos != npos; pos = find(text, pos + 1)) {
            found = pos;
        }
        const Naive last = naive::replace(text, found, from.size(), to);
        expectEdit(
            text, last, [&](String& s) { s.replaceLast(viewOf(from), viewOf(to), tag); }, describe);
    }
};
TYPED_TEST_SUITE(UStringEditProperty, StringTypes, StringTypeNames);

TYPED_TEST(UStringEditProperty, EditsAtEachPosition) {
    using Tested = typename TestFixture::String;
    for (const auto& text : naive::textsUpTo(4, this->twoUnits())) {
        for (const std::uint64_t pos : this->positionsFor(text.size())) {
            for (const char* const ascii : {"", "x", "xy", "xyzxyzxyzxyzxyzxyz"}) {
                const auto with = this->units(ascii);
                const auto view = this->viewOf(with);
                this->expectEdit(
                    text, naive::replace(text, pos, 0, with), [&](Tested& s) { s.insert(pos, view); },
                    [&] { return "insert " + this->rowOf(text, pos, 0, with); });
                for (const std::uint64_t count : this->positionsFor(text.size())) {
                    this->expectEdit(
                        text, naive::replace(text, pos, count, with),
                        [&](Tested& s) { s.replace(pos, count, view); },
                        [&] { return "replace " + this->rowOf(text, pos, count, with); });
                }
            }
            const auto x = this->units("x");
            this->expectEdit(
                text, naive::replace(text, pos, 0, x), [&](Tested& s) { s.insert(pos, x[0]); },
                [&] { return "insert a unit " + this->rowOf(text, pos, 0, x); });
            for (const std::uint64_t count : this->positionsFor(text.size())) {
                this->expectEdit(
                    text, naive::replace(text, pos, count, {}), [&](Tested& s) { s.erase(pos, count); },
                    [&] { return "erase " + this->rowOf(text, pos, count, {}); });
                const auto string = this->make(text);
                const auto start = static_cast<std::size_t>(std::min<std::uint64_t>(pos, text.size()));
                const auto view = string.substr(pos, count);
                ASSERT_EQ(view.data(), string.begin() + start) << this->rowOf(text, pos, count, {});
                ASSERT_TRUE(this->textOf(view) == text.substr(start, count))
                    << this->rowOf(text, pos, count, {});
            }
        }
    }
}

TYPED_TEST(UStringEditProperty, ReplacesEachSmallNeedleInEachSmallText) {
    const auto texts = naive::textsUpTo(6, this->twoUnits());
    const auto needles = naive::textsUpTo(2, this->twoUnits());
    for (const auto& text : texts) {
        for (const auto& from : needles) {
            for (const auto& to : needles) {
                ASSERT_NO_FATAL_FAILURE(
                    this->replaceEach(text, from, to, TestFixture::String::case_sensitive));
            }
        }
    }
}

TYPED_TEST(UStringEditProperty, ReplacesWithoutRegardToCase) {
    if constexpr (TestFixture::number != Encoding::Unknown) {
        const auto alphabet = this->units("aAb");
        const auto needles = naive::textsUpTo(2, alphabet);
        for (const auto& text : naive::textsUpTo(3, alphabet)) {
            for (const auto& from : needles) {
                for (const char* const to : {"", "A", "ba"}) {
                    ASSERT_NO_FATAL_FAILURE(
                        this->replaceEach(text, from, this->units(to), case_insensitive_t()));
                }
            }
        }
    }
}

TYPED_TEST(UStringEditProperty, ReplacesAtFoldedPositionsAsStated) {
    if constexpr (TestFixture::folds && TestFixture::number != Encoding::Wwjd) {
        // Longer, shorter and equally long when folded; in ASCII just bytes that have no case.
        std::vector<typename TestFixture::Units> characters;
        for (const char* const character : {"k", "N", "\u0149", "\u212A", "\u00DF"}) {
            characters.push_back(TestFixture::number == Encoding::UsAscii
                                     ? this->units(character)
                                     : this->textOf(this->converted(character)));
        }
        std::mt19937 random(11);
        const auto some = [&](std::size_t count) {
            typename TestFixture::Units text;
            for (; count > 0; --count) {
                text += characters[random() % characters.size()];
            }
            return text;
        };
        for (int round = 0; round < 400; ++round) {
            // What is found in the folded text may be cut out of characters of the stored one; UTF-8 that is none
            // cannot be folded by way of UTF-16, so that only one replacement is made there.
            if (TestFixture::number == Encoding::System) {
                const auto text = some(random() % 5);
                const auto from = some(1 + random() % 2);
                const auto to = some(random() % 3);
                const auto found = this->finder(from, case_insensitive_t())(text, 0);
                this->expectEdit(
                    text, naive::replace(text, found, from.size(), to),
                    [&](typename TestFixture::String& s) {
                        s.replaceFirst(this->viewOf(from), this->viewOf(to), case_insensitive_t());
                    },
                    [&] { return shown(text) + ": " + shown(from) + " by " + shown(to); });
            } else {
                ASSERT_NO_FATAL_FAILURE(this->replaceEach(some(random() % 5), some(1 + random() % 2),
                                                          some(random() % 3), case_insensitive_t()));
            }
        }
    }
}

TYPED_TEST(UStringEditProperty, EditsUnitsBySet) {
    using Tested = typename TestFixture::String;
    const typename TestFixture::Units alphabet{TestFixture::unit('a'), TestFixture::unit('\0'),
                                               TestFixture::highest};
    for (const auto& text : naive::textsUpTo(5, alphabet)) {
        for (const auto& members : naive::textsUpTo(2, alphabet)) {
            const auto set = this->set(members);
            const auto describe = [&] { return shown(text) + " by " + shown(members); };
            this->expectEdit(
                text, naive::strip(text, members), [&](Tested& s) { s.strip(set); }, describe);
            this->expectEdit(
                text, naive::rstrip(text, members), [&](Tested& s) { s.rstrip(set); }, describe);
            for (const auto to : {TestFixture::unit('z'), TestFixture::highest}) {
                this->expectEdit(
                    text, naive::replaceUnits(text, members, to), [&](Tested& s) { s.replaceAll(set, to); },
                    describe);
                if (members.size() == 1) {
                    this->expectEdit(
                        text, naive::replaceUnits(text, members, to),
                        [&](Tested& s) { s.replaceAll(members[0], to); }, describe);
                }
            }
            if (members.size() == 1) {
                this->expectEdit(
                    text, naive::removeAll(text, members[0]), [&](Tested& s) { s.removeAll(members[0]); },
                    describe);
            }
        }
    }
}

// One object lives through many edits, some with views of its own text, and is compared with a plain sequence.
TYPED_TEST(UStringEditProperty, FollowsAPlainSequenceThroughManyEdits) {
    using Tested = typename TestFixture::String;
    using Text = typename TestFixture::Units;
    std::mt19937 random(20240611);
    const auto alphabet = this->units("abc");
    for (int history = 0; history < 20; ++history) {
        auto string = this->make("");
        Text model;
        for (int step = 0; step < 300; ++step) {
            const std::uint64_t pos = random() % (model.size() + 1);
            const std::uint64_t count = random() % 8;
            const std::uint64_t from = random() % (model.size() + 1);
            const bool own = random() % 3 == 0;
            Text with;
            for (std::size_t size = random() % 6; with.size() < size;) {
                with += alphabet[random() % 3];
            }
            auto view = this->viewOf(with);
            if (own) {
                with = model.substr(from, random() % 12);
                view = string.substr(from, with.size());
            }
            const auto unit = alphabet[random() % 3];
            const auto operation = random() % 12;
            switch (operation) {
            case 0:
                string.append(view);
                model = *naive::replace(model, model.size(), 0, with);
                break;
            case 1:
                string.prepend(view);
                model = *naive::replace(model, 0, 0, with);
                break;
            case 2:
                string.insert(pos, view);
                model = *naive::replace(model, pos, 0, with);
                break;
            case 3:
            case 4:
                string.replace(pos, count, view);
                model = *naive::replace(model, pos, count, with);
                break;
            case 5:
                string.erase(pos, count);
                model = *naive::replace(model, pos, count, {});
                break;
            case 6:
                string.push_back(unit);
                model += unit;
                break;
            case 7:
                string.resize(pos + count, unit);
                model = pos + count <= model.size() ? model.substr(0, pos + count)
                                                    : model + Text(pos + count - model.size(), unit);
                break;
            case 8:
                if (!with.empty()) {
                    const Text to(count % 3, unit);
                    string.replaceAll(view, this->viewOf(to));
                    model = *naive::replaceAll(model, with, to, this->finder(with, Tested::case_sensitive));
                }
                break;
            case 9:
                string.removeAll(unit);
                model = naive::removeAll(model, unit);
                break;
            case 10:
                string.strip(this->set(Text(1, unit))).rstrip(this->set(Text(1, unit)));
                model = naive::rstrip(naive::strip(model, Text(1, unit)), Text(1, unit));
                break;
            default:
                string = string + this->make(with);
                model += with;
                break;
            }
            ASSERT_EQ(shown(this->textOf(string)), shown(model))
                << history << '.' << step << ": operation " << operation;
            ASSERT_EQ(string.rawData()[string.size()], typename TestFixture::Unit{0});
            if (model.size() > 300) {
                string.clear();
                model.clear();
            }
        }
    }
}

} // namespace
