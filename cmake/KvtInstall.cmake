# What `cmake --install` lays down: the shared library, the public headers as a file set, a package config for
# find_package(kvt CONFIG) and kvt.pc. All of it can be moved to another prefix as a whole.

include(CMakePackageConfigHelpers)

set(KVT_INSTALL_CMAKEDIR "${CMAKE_INSTALL_LIBDIR}/cmake/kvt")

# The components are what the packages are made of (KvtPackage.cmake).
install(TARGETS kvt
    EXPORT kvtTargets
    LIBRARY DESTINATION "${CMAKE_INSTALL_LIBDIR}" COMPONENT runtime NAMELINK_COMPONENT development
    FILE_SET HEADERS DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}" COMPONENT development)
install(EXPORT kvtTargets NAMESPACE kvt:: DESTINATION "${KVT_INSTALL_CMAKEDIR}" COMPONENT development)

# The command finds the library of its own prefix, wherever that has been moved to.
if(TARGET kvt_tool AND NOT IS_ABSOLUTE "${CMAKE_INSTALL_LIBDIR}" AND NOT IS_ABSOLUTE "${CMAKE_INSTALL_BINDIR}")
    file(RELATIVE_PATH KVT_LIBDIR_FROM_BINDIR "/prefix/${CMAKE_INSTALL_BINDIR}" "/prefix/${CMAKE_INSTALL_LIBDIR}")
    set_target_properties(kvt_tool PROPERTIES INSTALL_RPATH "$ORIGIN/${KVT_LIBDIR_FROM_BINDIR}")
endif()

configure_package_config_file(
    "${PROJECT_SOURCE_DIR}/cmake/kvtConfig.cmake.in" "${PROJECT_BINARY_DIR}/kvtConfig.cmake"
    INSTALL_DESTINATION "${KVT_INSTALL_CMAKEDIR}")
write_basic_package_version_file("${PROJECT_BINARY_DIR}/kvtConfigVersion.cmake" COMPATIBILITY SameMajorVersion)
install(FILES "${PROJECT_BINARY_DIR}/kvtConfig.cmake" "${PROJECT_BINARY_DIR}/kvtConfigVersion.cmake"
    DESTINATION "${KVT_INSTALL_CMAKEDIR}" COMPONENT development)

# kvt.pc finds its prefix from its own place, so that `cmake --install --prefix` and later moves keep it right;
# only a library folder given as an absolute path nails it down.
if(IS_ABSOLUTE "${CMAKE_INSTALL_LIBDIR}")
    set(KVT_PC_PREFIX "${CMAKE_INSTALL_PREFIX}")
    set(KVT_PC_LIBDIR "${CMAKE_INSTALL_LIBDIR}")
else()
    file(RELATIVE_PATH KVT_PC_UP "/prefix/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/prefix")
    string(REGEX REPLACE "/$" "" KVT_PC_UP "${KVT_PC_UP}")
    set(KVT_PC_PREFIX "\${pcfiledir}/${KVT_PC_UP}")
    set(KVT_PC_LIBDIR "\${prefix}/${CMAKE_INSTALL_LIBDIR}")
endif()
if(IS_ABSOLUTE "${CMAKE_INSTALL_INCLUDEDIR}")
    set(KVT_PC_INCLUDEDIR "${CMAKE_INSTALL_INCLUDEDIR}")
else()
    set(KVT_PC_INCLUDEDIR "\${prefix}/${CMAKE_INSTALL_INCLUDEDIR}")
endif()
get_target_property(KVT_BOOST_DIRS Boost::headers INTERFACE_INCLUDE_DIRECTORIES)
list(REMOVE_ITEM KVT_BOOST_DIRS ${CMAKE_CXX_IMPLICIT_INCLUDE_DIRECTORIES})
list(TRANSFORM KVT_BOOST_DIRS PREPEND " -I")
list(JOIN KVT_BOOST_DIRS "" KVT_PC_BOOST_CFLAGS)
configure_file("${PROJECT_SOURCE_DIR}/cmake/kvt.pc.in" "${PROJECT_BINARY_DIR}/kvt.pc" @ONLY)
install(FILES "${PROJECT_BINARY_DIR}/kvt.pc" DESTINATION "${CMAKE_INSTALL_LIBDIR}/pkgconfig" COMPONENT development)

# The pretty-printers of gdb, for this very library: gdb looks for a file with the library's full name and path under
# its folder of scripts. The path is that of where the library will be found, known when it is installed.
install(CODE "
    set(libdir \"${CMAKE_INSTALL_LIBDIR}\")
    cmake_path(ABSOLUTE_PATH libdir BASE_DIRECTORY \"\${CMAKE_INSTALL_PREFIX}\" NORMALIZE)
    file(REAL_PATH \"\${libdir}\" libdir)
    file(INSTALL DESTINATION \"\${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_DATADIR}/gdb/auto-load\${libdir}\"
        TYPE FILE RENAME \"libkvt.so.${PROJECT_VERSION}-gdb.py\"
        FILES \"${PROJECT_SOURCE_DIR}/tools/gdb/kvt_gdb.py\")"
    COMPONENT development)

install(FILES README.md CHANGELOG.md DESTINATION "${CMAKE_INSTALL_DOCDIR}" COMPONENT documentation)
install(DIRECTORY docs/ DESTINATION "${CMAKE_INSTALL_DOCDIR}/docs" COMPONENT documentation
    FILES_MATCHING PATTERN "*.md" PATTERN "*.svg")
install(DIRECTORY examples/ DESTINATION "${CMAKE_INSTALL_DOCDIR}/examples" COMPONENT documentation
    PATTERN "CMakeLists.txt" EXCLUDE)
