// A way to members that are private: the arguments of an explicit instantiation are not checked for access.
//
//     struct Text { using Type = void (Thing::*)(int) const; };
//     template struct kvt::test::PrivateMember<Text, &Thing::text>;
//     (thing.*kvt::test::privateMember<Text>)(1);
//
// The value is there once the program's own statics have been initialised.
#pragma once

namespace kvt::test {

template <typename Tag>
inline typename Tag::Type privateMember = nullptr;

template <typename Tag, typename Tag::Type Member>
struct PrivateMember {
    inline static const bool isKnown = [] {
        privateMember<Tag> = Member;
        return true;
    }();
};

} // namespace kvt::test
