# What `cmake --install` puts where: libraries, headers, the CMake package, the pkg-config file, the
# administrator's tool and its completions.

include(CMakePackageConfigHelpers)

install(TARGETS fileindex vanoplatform
    EXPORT fileindexTargets
    LIBRARY DESTINATION "${CMAKE_INSTALL_LIBDIR}")
install(TARGETS fileindexctl RUNTIME DESTINATION "${CMAKE_INSTALL_BINDIR}")
# The names by which the shells look for them.
install(FILES tools/completions/fileindexctl.bash RENAME fileindexctl
    DESTINATION "${CMAKE_INSTALL_DATADIR}/bash-completion/completions")
install(FILES tools/completions/_fileindexctl
    DESTINATION "${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions")
install(DIRECTORY include/fileindex DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}")
# For those who write another provider of the platform boundary.
install(FILES src/platform/vano_platform.h src/platform/monitor_queue.h
    DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}/vanoplatform")

set(package_dir "${CMAKE_INSTALL_LIBDIR}/cmake/fileindex")
install(EXPORT fileindexTargets NAMESPACE fileindex:: DESTINATION "${package_dir}")
configure_package_config_file(cmake/fileindexConfig.cmake.in
    "${PROJECT_BINARY_DIR}/fileindexConfig.cmake" INSTALL_DESTINATION "${package_dir}")
write_basic_package_version_file("${PROJECT_BINARY_DIR}/fileindexConfigVersion.cmake"
    COMPATIBILITY SameMajorVersion)
install(FILES "${PROJECT_BINARY_DIR}/fileindexConfig.cmake"
    "${PROJECT_BINARY_DIR}/fileindexConfigVersion.cmake" DESTINATION "${package_dir}")

# Relative to the file itself, so that the tree works wherever it is installed.
file(RELATIVE_PATH prefix_from_pkgconfig
    "${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig" "${CMAKE_INSTALL_PREFIX}")
string(REGEX REPLACE "/$" "" prefix_from_pkgconfig "${prefix_from_pkgconfig}")
configure_file(cmake/fileindex.pc.in "${PROJECT_BINARY_DIR}/fileindex.pc" @ONLY)
install(FILES "${PROJECT_BINARY_DIR}/fileindex.pc"
    DESTINATION "${CMAKE_INSTALL_LIBDIR}/pkgconfig")

# docs/man/NAME.SECTION
foreach(section IN ITEMS 1 3 5 7)
    install(DIRECTORY docs/man/ DESTINATION "${CMAKE_INSTALL_MANDIR}/man${section}"
        FILES_MATCHING PATTERN "*.${section}")
endforeach()
