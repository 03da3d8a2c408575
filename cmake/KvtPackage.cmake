# Debian packages, by `cpack -G DEB` in a build of preset `package`:
#
#   libkvt0       the shared library, with what dpkg-shlibdeps asks of those who use it (symbols, shlibs)
#   libkvt-dev    headers, the package config, kvt.pc, the pretty-printers of gdb
#   kvt           the command
#   kvt-doc       the documents and examples
#
# Each has the changelog and the copyright of Debian's policy under share/doc.

set(KVT_RUNTIME_PACKAGE "libkvt${PROJECT_VERSION_MAJOR}")
set(packages runtime ${KVT_RUNTIME_PACKAGE} development libkvt-dev command kvt documentation kvt-doc)

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME kvt)
set(CPACK_PACKAGE_VENDOR kvt)
set(CPACK_PACKAGE_DESCRIPTION_SUMMARY "Text in any encoding, dates as text, memory in a file")
set(CPACK_PACKAGE_CONTACT "The maintainers of kvt <maintainers@kvt.invalid>")
set(CPACK_PACKAGING_INSTALL_PREFIX "${CMAKE_INSTALL_PREFIX}")
# The pretty-printers' place depends on that of the library, which is not that of the packing.
set(CPACK_SET_DESTDIR ON)
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_COMPONENTS_ALL runtime development command documentation)
set(CPACK_COMPONENTS_GROUPING ONE_PER_GROUP)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION devel)
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)
set(CPACK_COMPONENT_DEVELOPMENT_DEPENDS runtime)

set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME ${KVT_RUNTIME_PACKAGE})
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_CONTROL_EXTRA
    "${PROJECT_BINARY_DIR}/package/symbols;${PROJECT_BINARY_DIR}/package/triggers")
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS_POLICY ">=")
set(about "kvt is a library for programs that translate data, and a command that does.")
set(CPACK_COMPONENT_RUNTIME_DESCRIPTION "${about}\n.\nThis package has the shared library.")

set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libkvt-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS
    "${KVT_RUNTIME_PACKAGE} (= ${PROJECT_VERSION}), libboost1.81-dev | libboost-dev (>= ${KVT_BOOST_VERSION})")
set(CPACK_COMPONENT_DEVELOPMENT_DESCRIPTION
    "${about}\n.\nThis package has what it takes to build programs with the library.")

set(CPACK_DEBIAN_COMMAND_PACKAGE_NAME kvt)
set(CPACK_DEBIAN_COMMAND_PACKAGE_SECTION utils)
set(CPACK_DEBIAN_COMMAND_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS "${PROJECT_BINARY_DIR}")
set(CPACK_DEBIAN_COMMAND_PACKAGE_DEPENDS "${KVT_RUNTIME_PACKAGE} (>= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_COMMAND_PACKAGE_RECOMMENDS tzdata)
set(CPACK_COMPONENT_COMMAND_DESCRIPTION "${about}\n.\nThis package has the command.")

set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_NAME kvt-doc)
set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_SECTION doc)
set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_ARCHITECTURE all)
set(CPACK_COMPONENT_DOCUMENTATION_DESCRIPTION "${about}\n.\nThis package has the documents and the examples.")

# ---- What Debian's policy asks for

file(WRITE "${PROJECT_BINARY_DIR}/package/triggers" "activate-noawait ldconfig\n")

# Which symbol came with which version. All of the first version so far: a name once exported stays.
add_custom_command(OUTPUT "${PROJECT_BINARY_DIR}/package/symbols"
    COMMAND "${PROJECT_SOURCE_DIR}/cmake/debian_symbols.sh" $<TARGET_FILE:kvt> ${KVT_RUNTIME_PACKAGE} 0.1.0
        "${PROJECT_BINARY_DIR}/package/symbols"
    DEPENDS kvt "${PROJECT_SOURCE_DIR}/cmake/debian_symbols.sh"
    VERBATIM)
add_custom_target(kvt_package_files ALL DEPENDS "${PROJECT_BINARY_DIR}/package/symbols")

set(changelog "${PROJECT_BINARY_DIR}/package/changelog")
file(WRITE "${changelog}" "kvt (${PROJECT_VERSION}) unstable; urgency=medium

  * The changes are in CHANGELOG.md of the package kvt-doc.

 -- ${CPACK_PACKAGE_CONTACT}  Sun, 22 Nov 2026 00:00:00 +0000
")
execute_process(COMMAND gzip -9nf "${changelog}" COMMAND_ERROR_IS_FATAL ANY)
file(WRITE "${PROJECT_BINARY_DIR}/package/copyright" "Format: https://www.debian.org/doc/packaging-manuals/copyright-format/1.0/
Upstream-Name: kvt

Files: *
Copyright: 2026 The maintainers of kvt
License: none-stated
 The source says nothing about a licence. Ask the maintainers.
")
list(LENGTH packages length)
math(EXPR last "${length} - 1")
foreach(place RANGE 0 ${last} 2)
    math(EXPR next "${place} + 1")
    list(GET packages ${place} component)
    list(GET packages ${next} package)
    install(FILES "${changelog}.gz" "${PROJECT_BINARY_DIR}/package/copyright"
        DESTINATION "${CMAKE_INSTALL_DATADIR}/doc/${package}" COMPONENT ${component})
endforeach()

# Manual pages are compressed there.
install(CODE "
    file(GLOB pages \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_MANDIR}/man1/*.1\")
    execute_process(COMMAND gzip -9nf \${pages} COMMAND_ERROR_IS_FATAL ANY)"
    COMPONENT command)

include(CPack)
