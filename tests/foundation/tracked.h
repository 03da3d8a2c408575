// An element that knows where it stands and keeps account of every construction, copy, move and destruction, and
// whose copies and moves can be made to throw.
#pragma once

#include <stdexcept>
#include <utility>
#include <vector>

namespace kvt::test {

struct TrackedCounts {
    long living = 0;
    long defaults = 0;
    long copies = 0;
    long moves = 0;
    /// Copies (and, where the element's moves may throw, moves) that succeed before one throws; -1: all do.
    long budget = -1;
    std::vector<int> destroyed;
};

class TrackedFailure : public std::runtime_error {
public:
    TrackedFailure() : std::runtime_error("no more copies") {}
};

template <bool MoveMayThrow>
class BasicTracked {
public:
    static inline TrackedCounts counts;

    BasicTracked() : BasicTracked(0) { ++counts.defaults; }
    BasicTracked(int value) : value_(value), self_(this) { ++counts.living; }
    BasicTracked(const BasicTracked& other) : value_(other.value_), self_(this) {
        spend();
        ++counts.living;
        ++counts.copies;
    }
    BasicTracked(BasicTracked&& other) noexcept(!MoveMayThrow) : value_(other.value_), self_(this) {
        if constexpr (MoveMayThrow) {
            spend();
        }
        other.value_ = movedFrom;
        ++counts.living;
        ++counts.moves;
    }
    BasicTracked& operator=(const BasicTracked& other) {
        spend();
        value_ = other.value_;
        ++counts.copies;
        return *this;
    }
    BasicTracked& operator=(BasicTracked&& other) noexcept(!MoveMayThrow) {
        if constexpr (MoveMayThrow) {
            spend();
        }
        if (this != &other) {
            value_ = std::exchange(other.value_, movedFrom);
        }
        ++counts.moves;
        return *this;
    }
    ~BasicTracked() {
        --counts.living;
        counts.destroyed.push_back(value_);
        self_ = nullptr;
    }

    int value() const { return value_; }
    /// Whether it came here by a constructor and not by a copy of its bytes.
    bool intact() const { return self_ == this && value_ != movedFrom; }

    friend bool operator==(const BasicTracked& left, const BasicTracked& right) {
        return left.value_ == right.value_;
    }

private:
    static constexpr int movedFrom = -12345;

    static void spend() {
        if (counts.budget == 0) {
            throw TrackedFailure();
        }
        if (counts.budget > 0) {
            --counts.budget;
        }
    }

    int value_;
    const BasicTracked* self_;
};

using Tracked = BasicTracked<false>;
using TrackedThrowingMove = BasicTracked<true>;

} // namespace kvt::test
