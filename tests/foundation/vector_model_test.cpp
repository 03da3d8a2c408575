// The same random operations on kvt::ex::vector and on std::vector, for elements of several kinds.
#include "tracked.h"

#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace {

using kvt::ex::UString;
using kvt::test::Tracked;

template <typename T>
struct Element {
    static T make(unsigned n) { return static_cast<T>(n); }
    static bool intact(const T&) { return true; }
};

template <>
struct Element<std::pair<std::size_t, std::size_t>> {
    static std::pair<std::size_t, std::size_t> make(unsigned n) { return {n, n * 7u}; }
    static bool intact(const std::pair<std::size_t, std::size_t>& p) { return p.second == p.first * 7; }
};

template <>
struct Element<Tracked> {
    static Tracked make(unsigned n) { return Tracked(static_cast<int>(n)); }
    static bool intact(const Tracked& element) { return element.intact(); }
};

template <std::uint32_t N>
struct Element<UString<N>> {
    static UString<N> make(unsigned n) {
        return UString<N>((std::string(n % 40, 'a') + std::to_string(n)).c_str());
    }
    static bool intact(const UString<N>& s) {
        return static_cast<const void*>(s.getAsIZQTString().data()) == static_cast<const void*>(s.rawData());
    }
};

template <typename T>
class VectorModel : public testing::Test {
protected:
    using Vector = kvt::ex::vector<T>;
    using Model = std::vector<T>;

    unsigned below(std::size_t limit) {
        return static_cast<unsigned>(std::uniform_int_distribution<std::size_t>(0, limit - 1)(random_));
    }
    T value() { return Element<T>::make(below(250)); }

    // The position of an operation, the same in both.
    std::ptrdiff_t place() { return static_cast<std::ptrdiff_t>(below(model_.size() + 1)); }

    void append() {
        switch (below(5)) {
        case 0: {
            const T v = value();
            model_.push_back(v);
            vector_.push_back(v);
            break;
        }
        case 1: {
            T v = value();
            model_.push_back(v);
            vector_.push_back(std::move(v));
            break;
        }
        case 2: {
            const T v = value();
            const T* const added = &vector_.emplace_back(v);
            EXPECT_EQ(added, &vector_.back());
            model_.emplace_back(v);
            break;
        }
        default:
            if (!model_.empty()) {
                const unsigned from = below(model_.size());
                model_.push_back(T(model_[from]));
                vector_.push_back(vector_[from]);
            }
        }
    }

    void insert() {
        const std::ptrdiff_t at = place();
        typename Vector::iterator result{};
        switch (below(5)) {
        case 0: {
            const T v = value();
            model_.insert(model_.begin() + at, v);
            result = vector_.insert(vector_.begin() + at, v);
            break;
        }
        case 1: {
            T v = value();
            model_.insert(model_.begin() + at, v);
            result = vector_.insert(vector_.begin() + at, std::move(v));
            break;
        }
        case 2: {
            const unsigned count = below(6);
            const T v = model_.empty() ? value() : model_[below(model_.size())];
            model_.insert(model_.begin() + at, count, v);
            result = vector_.insert(vector_.begin() + at, count, v);
            break;
        }
        case 3: {
            const Model more = someValues();
            model_.insert(model_.begin() + at, more.begin(), more.end());
            result = vector_.insert(vector_.begin() + at, more.begin(), more.end());
            break;
        }
        default: {
            const T a = value();
            const T b = value();
            model_.insert(model_.begin() + at, {a, b});
            result = vector_.insert(vector_.begin() + at, {a, b});
        }
        }
        EXPECT_EQ(result - vector_.begin(), at);
    }

    void erase() {
        if (model_.empty()) {
            return;
        }
        if (below(3) == 0) {
            model_.pop_back();
            vector_.pop_back();
            return;
        }
        const std::ptrdiff_t first = static_cast<std::ptrdiff_t>(below(model_.size()));
        const std::ptrdiff_t last =
            below(2) == 0 ? first + 1 : first + below(model_.size() - static_cast<std::size_t>(first) + 1);
        model_.erase(model_.begin() + first, model_.begin() + last);
        const auto result = last == first + 1 && below(2) == 0
                                ? vector_.erase(vector_.begin() + first)
                                : vector_.erase(vector_.begin() + first, vector_.begin() + last);
        EXPECT_EQ(result - vector_.begin(), first);
    }

    void size() {
        const unsigned count = below(60);
        switch (below(4)) {
        case 0:
            model_.resize(count);
            vector_.resize(count);
            break;
        case 1: {
            const T v = value();
            model_.resize(count, v);
            vector_.resize(count, v);
            break;
        }
        case 2:
            vector_.reserve(count);
            EXPECT_GE(vector_.capacity(), count);
            break;
        default:
            if (below(4) == 0) {
                const auto capacity = vector_.capacity();
                model_.clear();
                vector_.clear();
                EXPECT_EQ(vector_.capacity(), capacity);
            }
        }
    }

    void whole() {
        switch (below(8)) {
        case 0: {
            Vector copy(vector_);
            vector_ = copy;
            EXPECT_TRUE(copy == vector_);
            break;
        }
        case 1: {
            Vector moved(std::move(vector_));
            EXPECT_EQ(vector_.data(), nullptr);
            vector_ = std::move(moved);
            break;
        }
        case 2: {
            const Model more = someValues();
            Vector other(more.begin(), more.end());
            swap(vector_, other);
            Model(more).swap(model_);
            break;
        }
        case 3: {
            const Vector& self = vector_;
            vector_ = self;
            break;
        }
        case 4: {
            const T a = value();
            model_ = {a, a, a};
            vector_ = {a, a, a};
            break;
        }
        case 5: {
            const unsigned count = below(9);
            const T v = value();
            model_ = Model(count, v);
            vector_ = Vector(count, v);
            break;
        }
        case 6: {
            const Model more = someValues();
            model_ = more;
            vector_ = Vector(more.begin(), more.end());
            break;
        }
        default: {
            const Vector other(vector_);
            Vector changed(other);
            changed.push_back(value());
            EXPECT_TRUE(changed != vector_);
        }
        }
    }

    void step() {
        switch (below(6)) {
        case 0:
        case 1:
            return append();
        case 2:
            return insert();
        case 3:
            return erase();
        case 4:
            return size();
        default:
            return whole();
        }
    }

    void compare() {
        ASSERT_EQ(vector_.size(), model_.size());
        EXPECT_EQ(vector_.empty(), model_.empty());
        EXPECT_LE(vector_.size(), vector_.capacity());
        EXPECT_EQ(vector_.data() == nullptr, vector_.capacity() == 0);
        EXPECT_EQ(static_cast<bool>(vector_.deleter()), vector_.capacity() != 0);
        EXPECT_EQ(vector_.end() - vector_.begin(), static_cast<std::ptrdiff_t>(model_.size()));
        for (std::size_t i = 0; i < model_.size(); ++i) {
            ASSERT_TRUE(vector_[i] == model_[i]) << "element " << i;
            ASSERT_TRUE(Element<T>::intact(vector_[i])) << "element " << i;
        }
    }

    Model someValues() {
        Model result;
        for (unsigned i = below(8); i > 0; --i) {
            result.push_back(value());
        }
        return result;
    }

    std::mt19937 random_{20240817};
    Vector vector_;
    Model model_;
};

using Elements = testing::Types<char, std::uint64_t, std::pair<std::size_t, std::size_t>, Tracked, UString<0>,
                                UString<2>, UString<3>, UString<30>>;
TYPED_TEST_SUITE(VectorModel, Elements);

TYPED_TEST(VectorModel, BehavesAsTheStandardOne) {
    for (int i = 0; i < 6000; ++i) {
        SCOPED_TRACE("step " + std::to_string(i));
        this->step();
        this->compare();
        if (this->HasFailure()) {
            return;
        }
    }
}

TEST(VectorModelAccount, EveryElementThatWasMadeIsDestroyed) {
    Tracked::counts = {};
    {
        kvt::ex::vector<Tracked> v;
        std::mt19937 random(7);
        for (int i = 0; i < 3000; ++i) {
            switch (random() % 4) {
            case 0:
                v.insert(v.begin() + static_cast<std::ptrdiff_t>(random() % (v.size() + 1)), Tracked(i));
                break;
            case 1:
                v.resize(random() % 30);
                break;
            case 2:
                v = kvt::ex::vector<Tracked>(v);
                break;
            default:
                v.emplace_back(i);
            }
            ASSERT_EQ(Tracked::counts.living, static_cast<long>(v.size())) << "step " << i;
        }
    }
    EXPECT_EQ(Tracked::counts.living, 0);
}

} // namespace
