# What `cmake --install` lays down: the libraries, their headers, the files by which
# pkg-config and find_package find them, a program, and what there is to read.  All
# of it may be moved as one tree.

include(CMakePackageConfigHelpers)

set(packageDir ${CMAKE_INSTALL_LIBDIR}/cmake/quillon)
set(pkgConfigDir ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# libhearth lies beside libquillon, wherever the tree goes.
option(QUILLON_INSTALL_RPATH "Let what is installed find the libraries beside it" ON)
if(QUILLON_INSTALL_RPATH)
    set_target_properties(quillon PROPERTIES INSTALL_RPATH "$ORIGIN")
endif()

foreach(library IN ITEMS hearth quillon)
    install(TARGETS ${library} EXPORT ${library}Targets
        LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}
        ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
    install(EXPORT ${library}Targets NAMESPACE ${library}:: DESTINATION ${packageDir})
endforeach()

install(DIRECTORY include/ DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/quillon-1)

set(isShared ${BUILD_SHARED_LIBS})
configure_file(cmake/quillonConfig.cmake.in ${PROJECT_BINARY_DIR}/quillonConfig.cmake @ONLY)
write_basic_package_version_file(${PROJECT_BINARY_DIR}/quillonConfigVersion.cmake
    COMPATIBILITY SameMajorVersion)
install(FILES
    ${PROJECT_BINARY_DIR}/quillonConfig.cmake ${PROJECT_BINARY_DIR}/quillonConfigVersion.cmake
    DESTINATION ${packageDir})

# The .pc files name their prefix by where they themselves lie.
file(RELATIVE_PATH prefixFromPkgConfig
    ${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig ${CMAKE_INSTALL_PREFIX})
string(REGEX REPLACE "/$" "" prefixFromPkgConfig ${prefixFromPkgConfig})
file(RELATIVE_PATH libDirInPrefix ${CMAKE_INSTALL_PREFIX} ${CMAKE_INSTALL_FULL_LIBDIR})
file(RELATIVE_PATH includeDirInPrefix ${CMAKE_INSTALL_PREFIX} ${CMAKE_INSTALL_FULL_INCLUDEDIR})
# A static library brings what it is built of along, in this order.
if(NOT BUILD_SHARED_LIBS)
    set(requiredIfStatic "libpng zlib libhwy ")
    set(linkedIfStatic " -lstdc++ -lm")
endif()
foreach(library IN ITEMS hearth quillon)
    configure_file(cmake/${library}.pc.in ${PROJECT_BINARY_DIR}/${library}.pc @ONLY)
    install(FILES ${PROJECT_BINARY_DIR}/${library}.pc DESTINATION ${pkgConfigDir})
endforeach()

if(QUILLON_EXAMPLES)
    if(QUILLON_INSTALL_RPATH)
        file(RELATIVE_PATH librariesFromPrograms
            ${CMAKE_INSTALL_FULL_BINDIR} ${CMAKE_INSTALL_FULL_LIBDIR})
        set_target_properties(thumbnail PROPERTIES
            INSTALL_RPATH "$ORIGIN/${librariesFromPrograms}")
    endif()
    install(TARGETS thumbnail RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})
    install(FILES docs/man/quillon-thumbnail.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1)
endif()

# The README and what it links to.
install(FILES LICENSE README.md CHANGELOG.md CONTRIBUTING.md SECURITY.md
    DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(DIRECTORY docs DESTINATION ${CMAKE_INSTALL_DOCDIR}
    FILES_MATCHING PATTERN *.md PATTERN *.png PATTERN *.svg PATTERN man EXCLUDE)
install(DIRECTORY examples DESTINATION ${CMAKE_INSTALL_DOCDIR}
    PATTERN CMakeLists.txt EXCLUDE PATTERN lake.png EXCLUDE)

# The loader finds a new library in its own folders only once its cache is told.
if(BUILD_SHARED_LIBS AND NOT CMAKE_CROSSCOMPILING)
    install(CODE [[
        if(CMAKE_INSTALL_PREFIX MATCHES "^/usr(/local)?/?$" AND "$ENV{DESTDIR}" STREQUAL "")
            execute_process(COMMAND ldconfig RESULT_VARIABLE failure OUTPUT_QUIET ERROR_QUIET)
            if(failure)
                message(NOTICE "Run ldconfig as root, so that programs find the libraries")
            endif()
        endif()]])
endif()
