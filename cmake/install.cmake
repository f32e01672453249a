# What `cmake --install` lays down: two shared libraries, their headers, and the
# files by which pkg-config and find_package find them.  All of it may be moved
# as one tree.

include(CMakePackageConfigHelpers)

set(packageDir ${CMAKE_INSTALL_LIBDIR}/cmake/quillon)
set(pkgConfigDir ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# libhearth lies beside libquillon, wherever the tree goes.
set_target_properties(quillon PROPERTIES INSTALL_RPATH "$ORIGIN")

foreach(library IN ITEMS hearth quillon)
    install(TARGETS ${library} EXPORT ${library}Targets LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
    install(EXPORT ${library}Targets NAMESPACE ${library}:: DESTINATION ${packageDir})
endforeach()

install(DIRECTORY include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/quillon-1)

write_basic_package_version_file(${PROJECT_BINARY_DIR}/quillonConfigVersion.cmake
    COMPATIBILITY SameMajorVersion)
install(FILES cmake/quillonConfig.cmake ${PROJECT_BINARY_DIR}/quillonConfigVersion.cmake
    DESTINATION ${packageDir})

# The .pc files name their prefix by where they themselves lie.
file(RELATIVE_PATH prefixFromPkgConfig
    ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" prefixFromPkgConfig ${prefixFromPkgConfig})
file(RELATIVE_PATH libDirInPrefix ${CMAKE_INSTALL_PREFIX} ${CMAKE_INSTALL_FULL_LIBDIR})
file(RELATIVE_PATH includeDirInPrefix ${CMAKE_INSTALL_PREFIX} ${CMAKE_INSTALL_FULL_INCLUDEDIR})
foreach(library IN ITEMS hearth quillon)
    configure_file(cmake/${library}.pc.in ${PROJECT_BINARY_DIR}/${library}.pc @ONLY)
    install(FILES ${PROJECT_BINARY_DIR}/${library}.pc DESTINATION ${pkgConfigDir})
endforeach()
