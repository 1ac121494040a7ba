# What `cmake --install` and `cpack` give: libraries with their headers, the CMake package and the pkg-config files; the
# tool with its manual page and completions; resources and documents.
include(CMakePackageConfigHelpers)

# Headers include each other by paths from src/. Installed they lie in one folder, <qvcontenttagging/Error.h>, so that
# no host is touched when a file moves to another room.
list(TRANSFORM QVCT_PUBLIC_HEADERS PREPEND "${PROJECT_SOURCE_DIR}/src/" OUTPUT_VARIABLE headers)
list(TRANSFORM QVCT_PUBLIC_DATABASE_HEADERS PREPEND "${PROJECT_SOURCE_DIR}/" OUTPUT_VARIABLE database_headers)
foreach(header IN LISTS headers database_headers)
  cmake_path(GET header FILENAME name)
  set(installed "${PROJECT_BINARY_DIR}/include/qvcontenttagging/${name}")
  add_custom_command(OUTPUT "${installed}"
    COMMAND ${CMAKE_COMMAND} -DINPUT=${header} -DOUTPUT=${installed}
            -P "${PROJECT_SOURCE_DIR}/cmake/InstalledHeader.cmake"
    DEPENDS "${header}" "${PROJECT_SOURCE_DIR}/cmake/InstalledHeader.cmake" VERBATIM
    COMMENT "Header ${name} as it is installed")
  list(APPEND installed_headers "${installed}")
  install(FILES "${installed}" DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}/qvcontenttagging")
endforeach()
add_custom_target(qvct_installed_headers ALL DEPENDS ${installed_headers})

# Two export sets, so that a host that loads the shared libraries needs none of what they are built on.
set_target_properties(qvcontenttagging_shared PROPERTIES EXPORT_NAME qvcontenttagging)
set_target_properties(qvct_contentdb_shared PROPERTIES EXPORT_NAME contentdb)
set_target_properties(qvcontenttagging PROPERTIES EXPORT_NAME qvcontenttagging_static)
set_target_properties(qvct_contentdb PROPERTIES EXPORT_NAME contentdb_static)
install(TARGETS qvcontenttagging_shared qvct_contentdb_shared EXPORT QVContentTaggingShared
        INCLUDES DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}")
install(TARGETS qvcontenttagging qvct_contentdb EXPORT QVContentTaggingStatic
        INCLUDES DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}")
set(package_folder "${CMAKE_INSTALL_LIBDIR}/cmake/QVContentTagging")
foreach(kind IN ITEMS Shared Static)
  install(EXPORT QVContentTagging${kind} NAMESPACE qvct:: DESTINATION "${package_folder}")
endforeach()
configure_package_config_file("${PROJECT_SOURCE_DIR}/cmake/QVContentTaggingConfig.cmake.in"
  "${PROJECT_BINARY_DIR}/QVContentTaggingConfig.cmake" INSTALL_DESTINATION "${package_folder}"
  NO_SET_AND_CHECK_MACRO)
# Until 1.0 each minor version may break what hosts have written.
write_basic_package_version_file("${PROJECT_BINARY_DIR}/QVContentTaggingConfigVersion.cmake"
  COMPATIBILITY SameMinorVersion)
install(FILES "${PROJECT_BINARY_DIR}/QVContentTaggingConfig.cmake"
  "${PROJECT_BINARY_DIR}/QVContentTaggingConfigVersion.cmake" DESTINATION "${package_folder}")

file(RELATIVE_PATH QVCT_PREFIX_FROM_PKGCONFIG
  "${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig" "${CMAKE_INSTALL_PREFIX}")
foreach(name IN ITEMS qvcontenttagging qvcontentdb)
  configure_file("${PROJECT_SOURCE_DIR}/cmake/${name}.pc.in" "${PROJECT_BINARY_DIR}/${name}.pc" @ONLY)
  install(FILES "${PROJECT_BINARY_DIR}/${name}.pc" DESTINATION "${CMAKE_INSTALL_LIBDIR}/pkgconfig")
endforeach()

install(DIRECTORY "${PROJECT_SOURCE_DIR}/src/resources/data/"
  DESTINATION "${CMAKE_INSTALL_DATADIR}/qvcontenttagging/resources")
install(FILES "${PROJECT_SOURCE_DIR}/README.md" "${PROJECT_SOURCE_DIR}/CHANGELOG.md" "${PROJECT_SOURCE_DIR}/LICENSE"
  DESTINATION "${CMAKE_INSTALL_DOCDIR}")
install(DIRECTORY "${PROJECT_SOURCE_DIR}/docs" DESTINATION "${CMAKE_INSTALL_DOCDIR}"
  FILES_MATCHING PATTERN "*.md" PATTERN "*.svg")
install(DIRECTORY "${PROJECT_SOURCE_DIR}/examples/host" DESTINATION "${CMAKE_INSTALL_DOCDIR}/examples")

if(QVCT_BUILD_TOOL)
  install(TARGETS qvtag)
  install(FILES "${QVCT_GENERATED_BY_TOOL}/qvtag.1" DESTINATION "${CMAKE_INSTALL_MANDIR}/man1")
  install(FILES "${QVCT_GENERATED_BY_TOOL}/qvtag.bash"
    DESTINATION "${CMAKE_INSTALL_DATADIR}/bash-completion/completions" RENAME qvtag)
  install(FILES "${QVCT_GENERATED_BY_TOOL}/_qvtag" DESTINATION "${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions")
  install(FILES "${QVCT_GENERATED_BY_TOOL}/qvtag.fish"
    DESTINATION "${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d")
endif()

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME qvcontenttagging)
set(CPACK_PACKAGE_VENDOR "QVContentTagging")
set(CPACK_PACKAGE_CONTACT "QVContentTagging <maintainers@qvcontenttagging.invalid>")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_STRIP_FILES ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_SECTION sound)
# The tool and the libraries name what they load; dpkg-shlibdeps turns that into packages.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS "${PROJECT_BINARY_DIR}/src" "${PROJECT_BINARY_DIR}/contentdb")
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_PACKAGE_CONTROL_EXTRA "${PROJECT_BINARY_DIR}/triggers")
file(WRITE "${PROJECT_BINARY_DIR}/triggers" "activate-noawait ldconfig\n")
include(CPack)
