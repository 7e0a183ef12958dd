# What "cmake --install" puts where: the libraries with their header, the files by which other builds find them, the
# man pages and the documentation. The programs install themselves.

include(CMakePackageConfigHelpers)

set(package_dir ${CMAKE_INSTALL_LIBDIR}/cmake/quillmere)

install(FILES ${PROJECT_SOURCE_DIR}/include/quillmere.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR})

# An export of its own for each library: who links the shared one need not have what the static one is linked with.
install(TARGETS quillmere EXPORT quillmere_shared
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(TARGETS quillmere_static EXPORT quillmere_static
    ARCHIVE DESTINATION ${CMAKE_INSTALL_LIBDIR})
foreach(kind shared static)
    install(EXPORT quillmere_${kind} NAMESPACE quillmere:: DESTINATION ${package_dir}
        FILE quillmere-${kind}-targets.cmake)
endforeach()

# A major version is one interface, and within it newer is compatible: see docs/abi.md.
write_basic_package_version_file(${PROJECT_BINARY_DIR}/quillmere-config-version.cmake
    COMPATIBILITY SameMajorVersion)
install(FILES
    ${PROJECT_SOURCE_DIR}/cmake/quillmere-config.cmake
    ${PROJECT_BINARY_DIR}/quillmere-config-version.cmake
    DESTINATION ${package_dir})

# Filled in when it is installed, since "cmake --install --prefix" may choose another place.
install(CODE "
    set(libdir \"${CMAKE_INSTALL_LIBDIR}\")
    set(includedir \"${CMAKE_INSTALL_INCLUDEDIR}\")
    set(version ${PROJECT_VERSION})
    configure_file(\"${PROJECT_SOURCE_DIR}/cmake/quillmere.pc.in\" \"${PROJECT_BINARY_DIR}/quillmere.pc\" @ONLY)")
install(FILES ${PROJECT_BINARY_DIR}/quillmere.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig)

# Away from where the system looks for libraries, the command line finds its own beside it.
if(QUILLMERE_BUILD_TOOLS AND NOT CMAKE_INSTALL_PREFIX MATCHES "^/usr(/local)?$")
    file(RELATIVE_PATH bin_to_lib /prefix/${CMAKE_INSTALL_BINDIR} /prefix/${CMAKE_INSTALL_LIBDIR})
    set_property(TARGET quillmere_tool PROPERTY INSTALL_RPATH "$ORIGIN/${bin_to_lib}")
endif()

install(FILES README.md CHANGELOG.md DESTINATION ${CMAKE_INSTALL_DOCDIR})
install(DIRECTORY docs/ DESTINATION ${CMAKE_INSTALL_DOCDIR}/docs
    FILES_MATCHING PATTERN "*.md" PATTERN "*.schema.json" PATTERN man EXCLUDE PATTERN reference EXCLUDE)
