// The way to private members that are part of what the library exports.
//
//     struct LoadSegment { friend auto memberOf(LoadSegment); };
//     template struct Opens<LoadSegment, &memory_manager::load_segment>;
//     (manager.*memberOf(LoadSegment()))(...)
//
// An explicit instantiation may name what is private, which is all that this rests on.
#pragma once

namespace kvt::test {

template <typename Tag, auto Member>
struct Opens {
    friend auto memberOf(Tag) { return Member; }
};

} // namespace kvt::test
