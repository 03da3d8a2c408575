# The zone component of the date library, compiled here: it has to read a plain text database from a folder, and what
# distributions ship reads the system's compiled zone files. It is one file of that library's source tree, taken as it
# is; the headers beside it go before installed ones, so that all of kvt sees one version of them.
#
#   kvt_date_headers   the headers and how they are configured
#   kvt_date           the component's object; it goes into both libraries, and none of its names leave the shared one

set(KVT_DATE_SOURCE_DIR "${PROJECT_SOURCE_DIR}/.deps/date" CACHE PATH
    "Source tree of the date library, with src/tz.cpp and include/date/tz.h")

foreach(file IN ITEMS src/tz.cpp include/date/tz.h)
    if(NOT EXISTS "${KVT_DATE_SOURCE_DIR}/${file}")
        message(FATAL_ERROR
            "kvt needs the source of the date library, and ${KVT_DATE_SOURCE_DIR}/${file} does not exist.\n"
            "On Debian or Ubuntu: './dev setup' fetches it from the distribution's source package.\n"
            "Elsewhere, or with a tree of your own: cmake -D KVT_DATE_SOURCE_DIR=/path/to/date")
    endif()
endforeach()

add_library(kvt_date_headers INTERFACE)
target_include_directories(kvt_date_headers SYSTEM INTERFACE "${KVT_DATE_SOURCE_DIR}/include")
target_compile_definitions(kvt_date_headers INTERFACE USE_OS_TZDB=0 AUTO_DOWNLOAD=0 HAS_REMOTE_API=0)
target_link_libraries(kvt_date_headers INTERFACE date::date)

add_library(kvt_date OBJECT "${KVT_DATE_SOURCE_DIR}/src/tz.cpp")
target_compile_features(kvt_date PRIVATE cxx_std_20)
target_compile_options(kvt_date PRIVATE -w) # its warnings are not ours
# Its assertions are about the text of the database, and would end the process of the host.
target_compile_definitions(kvt_date PRIVATE NDEBUG)
target_link_libraries(kvt_date PRIVATE kvt_date_headers Threads::Threads)
set_target_properties(kvt_date PROPERTIES
    POSITION_INDEPENDENT_CODE ON
    CXX_VISIBILITY_PRESET hidden
    VISIBILITY_INLINES_HIDDEN ON)
kvt_harden(kvt_date)
