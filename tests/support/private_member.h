// The way to members that are private: an explicit instantiation may name them, which is all that this rests on.
//
//     struct Text { using Type = void (Thing::*)(int) const; friend Type memberOf(Text); };
//     template struct Opens<Text, &Thing::text>;
//     (thing.*memberOf(Text()))(1);
#pragma once

namespace kvt::test {

template <typename Tag, typename Tag::Type Member>
struct Opens {
    friend typename Tag::Type memberOf(Tag) { return Member; }
};

} // namespace kvt::test
