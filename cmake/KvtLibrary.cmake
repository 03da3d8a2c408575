# The library's targets, and the two functions with which each folder of kvt/ names what it brings.
#
#   kvt_objects   every source, compiled once
#   kvt           the shared library, alias kvt::kvt; exports what is marked KVT_EXPORT, and nothing else
#   kvt_static    the same objects with the private parts within reach; for tests, never installed
#
# The public headers are known to CMake as a file set of kvt, and to the header tests as the global property
# KVT_PUBLIC_HEADERS (paths from the include root, such as kvt/string/ustring.h). Those that need another library's
# headers, which <kvt/kvt.h> leaves out, stand in KVT_OPTIONAL_HEADERS as well.

add_library(kvt_objects OBJECT)
target_compile_features(kvt_objects PUBLIC cxx_std_20)
target_include_directories(kvt_objects PUBLIC "${PROJECT_SOURCE_DIR}")
target_link_libraries(kvt_objects PRIVATE
    ICU::uc Boost::headers double-conversion::double-conversion kvt_date_headers Threads::Threads)
set_target_properties(kvt_objects PROPERTIES
    POSITION_INDEPENDENT_CODE ON
    CXX_VISIBILITY_PRESET hidden
    VISIBILITY_INLINES_HIDDEN ON)
# Of Highway the headers are enough (kvt/platform/vector_targets.h). What it checks in builds that are not optimised would
# call its library.
add_library(kvt_highway_headers INTERFACE)
target_include_directories(kvt_highway_headers SYSTEM INTERFACE
    $<TARGET_PROPERTY:hwy::hwy,INTERFACE_INCLUDE_DIRECTORIES>)
target_compile_definitions(kvt_highway_headers INTERFACE HWY_WANT_AVX3_DL HWY_IS_DEBUG_BUILD=0)
target_link_libraries(kvt_objects PRIVATE kvt_highway_headers)
# What the library exports and calls itself is not replaced by a program, and may be inlined.
target_compile_options(kvt_objects PRIVATE -fno-semantic-interposition)
kvt_warnings(kvt_objects)
kvt_harden(kvt_objects)
kvt_count_lines(kvt_objects)

add_library(kvt SHARED)
add_library(kvt::kvt ALIAS kvt)
add_library(kvt_static STATIC)
set_target_properties(kvt PROPERTIES
    VERSION ${PROJECT_VERSION}
    SOVERSION ${PROJECT_VERSION_MAJOR}
    LINK_DEPENDS "${PROJECT_SOURCE_DIR}/cmake/kvt.map")
target_link_options(kvt PRIVATE
    "LINKER:--version-script=${PROJECT_SOURCE_DIR}/cmake/kvt.map"
    # What the library exports and calls itself, it calls without a detour.
    LINKER:-Bsymbolic-functions
    # The system calls back into it at the end of each thread that has converted text.
    LINKER:-z,nodelete)
kvt_harden(kvt)
if(NOT KVT_SANITIZE) # a sanitizer's run-time is in the program, not in its libraries
    target_link_options(kvt PRIVATE LINKER:--no-undefined)
endif()

# Names the sources of one folder, relative to it.
function(kvt_sources)
    list(TRANSFORM ARGN PREPEND "${CMAKE_CURRENT_SOURCE_DIR}/")
    target_sources(kvt_objects PRIVATE ${ARGN})
endfunction()

# Names sources of one folder that write into strings without filling them first, where the standard library of C++23
# lets them. They compile without that, too, and clang gets them so: what clang 14 makes of C++23 has strings allocate at
# each replacement, also in all other sources, since the linker keeps one copy of an inline function.
function(kvt_in_place_sources)
    if(NOT CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
        return()
    endif()
    list(TRANSFORM ARGN PREPEND "${CMAKE_CURRENT_SOURCE_DIR}/")
    set_source_files_properties(${ARGN} TARGET_DIRECTORY kvt_objects PROPERTIES COMPILE_OPTIONS "-std=c++2b")
endfunction()

# Names the public headers of one folder, relative to it.
function(kvt_public_headers)
    list(TRANSFORM ARGN PREPEND "${CMAKE_CURRENT_SOURCE_DIR}/")
    target_sources(kvt PUBLIC FILE_SET HEADERS BASE_DIRS "${PROJECT_SOURCE_DIR}" FILES ${ARGN})
    foreach(header IN LISTS ARGN)
        file(RELATIVE_PATH name "${PROJECT_SOURCE_DIR}" "${header}")
        set_property(GLOBAL APPEND PROPERTY KVT_PUBLIC_HEADERS "${name}")
    endforeach()
endfunction()

# Names the public headers of one folder that only users of another library include.
function(kvt_optional_headers)
    kvt_public_headers(${ARGN})
    foreach(header IN LISTS ARGN)
        file(RELATIVE_PATH name "${PROJECT_SOURCE_DIR}" "${CMAKE_CURRENT_SOURCE_DIR}/${header}")
        set_property(GLOBAL APPEND PROPERTY KVT_OPTIONAL_HEADERS "${name}")
    endforeach()
endfunction()

# Makes both libraries from the objects; called once, after all folders have named their sources.
function(kvt_finish_library)
    foreach(library IN ITEMS kvt kvt_static)
        target_sources(${library} PRIVATE $<TARGET_OBJECTS:kvt_objects> $<TARGET_OBJECTS:kvt_date>)
        target_link_libraries(${library} PRIVATE
            ICU::uc double-conversion::double-conversion Threads::Threads)
        set_target_properties(${library} PROPERTIES LINKER_LANGUAGE CXX)
    endforeach()
    # Boost's headers show in the public ones of kvt/mmap.
    target_link_libraries(kvt INTERFACE Boost::headers)
    target_link_libraries(kvt_static INTERFACE Boost::headers kvt_highway_headers)
    target_compile_features(kvt INTERFACE cxx_std_17)
    target_compile_features(kvt_static INTERFACE cxx_std_20)
    target_include_directories(kvt_static INTERFACE "${PROJECT_SOURCE_DIR}")
endfunction()
