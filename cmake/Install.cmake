# What `make install` puts where, and how other programs find it: find_package(KorvaneBook) and pkg-config korvane-book.

include(CMakePackageConfigHelpers)

install(TARGETS korvane_book EXPORT KorvaneBookTargets LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(DIRECTORY "${CMAKE_SOURCE_DIR}/src/framework" "${CMAKE_SOURCE_DIR}/src/core" "${CMAKE_SOURCE_DIR}/src/documents"
                  "${CMAKE_SOURCE_DIR}/src/commands" "${CMAKE_SOURCE_DIR}/src/content" "${CMAKE_SOURCE_DIR}/src/output"
        DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/korvane-book FILES_MATCHING PATTERN "*.h")
install(FILES "${CMAKE_SOURCE_DIR}/LICENSE" DESTINATION ${CMAKE_INSTALL_DOCDIR})

install(EXPORT KorvaneBookTargets NAMESPACE KorvaneBook:: DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/KorvaneBook)
file(WRITE "${CMAKE_BINARY_DIR}/KorvaneBookConfig.cmake"
    "include(\"\${CMAKE_CURRENT_LIST_DIR}/KorvaneBookTargets.cmake\")\n")
write_basic_package_version_file("${CMAKE_BINARY_DIR}/KorvaneBookConfigVersion.cmake" COMPATIBILITY SameMinorVersion)
install(FILES "${CMAKE_BINARY_DIR}/KorvaneBookConfig.cmake" "${CMAKE_BINARY_DIR}/KorvaneBookConfigVersion.cmake"
        DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmake/KorvaneBook)

# Relative, so that an installed tree can be moved, and installed with another --prefix than was configured.
file(RELATIVE_PATH KORVANE_PC_PREFIX "/${CMAKE_INSTALL_LIBDIR}/pkgconfig" "/")
string(REGEX REPLACE "/$" "" KORVANE_PC_PREFIX "${KORVANE_PC_PREFIX}")
configure_file("${CMAKE_SOURCE_DIR}/cmake/korvane-book.pc.in" "${CMAKE_BINARY_DIR}/korvane-book.pc" @ONLY)
install(FILES "${CMAKE_BINARY_DIR}/korvane-book.pc" DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)
