// The one way to the headers of the engine.
//
// The engine keeps memory for its next search in a cache that all threads share, so that they wait for each other at
// every search. Its header for that is left out by the name that guards it; each thread has a block of its own instead.
#pragma once

#define BOOST_REGEX_V5_MEM_BLOCK_CACHE_HPP
#include <boost/regex/config.hpp>

namespace boost::BOOST_REGEX_DETAIL_NS {

/// A block of BOOST_REGEX_BLOCKSIZE bytes. Throws std::bad_alloc.
void* get_mem_block();
/// Takes back what the function above gave to this thread.
void put_mem_block(void* block);

} // namespace boost::BOOST_REGEX_DETAIL_NS

#include <boost/regex.hpp>

namespace kvt::ex::detail {

using Engine = boost::basic_regex<char>;

} // namespace kvt::ex::detail
