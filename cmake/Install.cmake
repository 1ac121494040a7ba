# What `cmake --install` and `cpack` give. Who runs the tool or a host gets the tool, the shared libraries, resources and
# documents; who builds a host also headers, static libraries, the CMake package and the pkg-config files.
include(CMakePackageConfigHelpers)
set(CMAKE_INSTALL_DEFAULT_COMPONENT_NAME runtime)

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
  install(FILES "${installed}" DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}/qvcontenttagging" COMPONENT dev)
endforeach()
add_custom_target(qvct_installed_headers ALL DEPENDS ${installed_headers})

# Two export sets, so that a host that loads the shared libraries needs none of what they are built on.
set_target_properties(qvcontenttagging_shared PROPERTIES EXPORT_NAME qvcontenttagging)
set_target_properties(qvct_contentdb_shared PROPERTIES EXPORT_NAME contentdb)
set_target_properties(qvcontenttagging PROPERTIES EXPORT_NAME qvcontenttagging_static)
set_target_properties(qvct_contentdb PROPERTIES EXPORT_NAME contentdb_static)
install(TARGETS qvcontenttagging_shared qvct_contentdb_shared EXPORT QVContentTaggingShared
        LIBRARY NAMELINK_COMPONENT dev
        INCLUDES DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}")
install(TARGETS qvcontenttagging qvct_contentdb EXPORT QVContentTaggingStatic
        ARCHIVE COMPONENT dev
        INCLUDES DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}")
# `--strip` and cpack pass archives over.
foreach(library IN ITEMS qvcontenttagging qvcontentdb)
  set(archive "\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_LIBDIR}/lib${library}.a")
  install(CODE "execute_process(COMMAND \"${CMAKE_STRIP}\" --strip-debug \"${archive}\" COMMAND_ERROR_IS_FATAL ANY)"
          COMPONENT dev)
endforeach()
# Where the libraries look for it.
install(TARGETS qvct_index_worker DESTINATION "${CMAKE_INSTALL_LIBEXECDIR}/qvcontenttagging")
set(package_folder "${CMAKE_INSTALL_LIBDIR}/cmake/QVContentTagging")
foreach(kind IN ITEMS Shared Static)
  install(EXPORT QVContentTagging${kind} NAMESPACE qvct:: DESTINATION "${package_folder}" COMPONENT dev)
endforeach()
configure_package_config_file("${PROJECT_SOURCE_DIR}/cmake/QVContentTaggingConfig.cmake.in"
  "${PROJECT_BINARY_DIR}/QVContentTaggingConfig.cmake" INSTALL_DESTINATION "${package_folder}"
  NO_SET_AND_CHECK_MACRO)
# Until 1.0 each minor version may break what hosts have written.
write_basic_package_version_file("${PROJECT_BINARY_DIR}/QVContentTaggingConfigVersion.cmake"
  COMPATIBILITY SameMinorVersion)
install(FILES "${PROJECT_BINARY_DIR}/QVContentTaggingConfig.cmake"
  "${PROJECT_BINARY_DIR}/QVContentTaggingConfigVersion.cmake" DESTINATION "${package_folder}" COMPONENT dev)

file(RELATIVE_PATH QVCT_PREFIX_FROM_PKGCONFIG
  "${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig" "${CMAKE_INSTALL_PREFIX}")
# Whoever links the shared libraries needs no other development package; the static ones have files of their own.
foreach(name IN ITEMS qvcontenttagging qvcontentdb qvcontenttagging-static qvcontentdb-static)
  configure_file("${PROJECT_SOURCE_DIR}/cmake/${name}.pc.in" "${PROJECT_BINARY_DIR}/${name}.pc" @ONLY)
  install(FILES "${PROJECT_BINARY_DIR}/${name}.pc" DESTINATION "${CMAKE_INSTALL_LIBDIR}/pkgconfig" COMPONENT dev)
endforeach()

install(DIRECTORY "${PROJECT_SOURCE_DIR}/src/resources/data/"
  DESTINATION "${CMAKE_INSTALL_DATADIR}/qvcontenttagging/resources")
install(FILES "${PROJECT_SOURCE_DIR}/README.md" "${PROJECT_SOURCE_DIR}/CHANGELOG.md"
  "${PROJECT_SOURCE_DIR}/CONTRIBUTING.md" "${PROJECT_SOURCE_DIR}/SECURITY.md" "${PROJECT_SOURCE_DIR}/LICENSE"
  DESTINATION "${CMAKE_INSTALL_DOCDIR}")
install(DIRECTORY "${PROJECT_SOURCE_DIR}/docs" DESTINATION "${CMAKE_INSTALL_DOCDIR}"
  FILES_MATCHING PATTERN "*.md" PATTERN "*.svg")
install(DIRECTORY "${PROJECT_SOURCE_DIR}/examples/host" DESTINATION "${CMAKE_INSTALL_DOCDIR}/examples" COMPONENT dev)

if(QVCT_BUILD_TOOL)
  install(TARGETS qvtag)
  install(FILES "${QVCT_GENERATED_BY_TOOL}/qvtag.1" DESTINATION "${CMAKE_INSTALL_MANDIR}/man1")
  install(FILES "${QVCT_GENERATED_BY_TOOL}/qvtag.bash"
    DESTINATION "${CMAKE_INSTALL_DATADIR}/bash-completion/completions" RENAME qvtag)
  install(FILES "${QVCT_GENERATED_BY_TOOL}/_qvtag" DESTINATION "${CMAKE_INSTALL_DATADIR}/zsh/vendor-completions")
  install(FILES "${QVCT_GENERATED_BY_TOOL}/qvtag.fish"
    DESTINATION "${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d")
endif()

# Three Debian packages: what runs, what hosts are built with, and the debug symbols of what runs.
set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME qvcontenttagging)
set(CPACK_PACKAGE_VENDOR "QVContentTagging")
set(CPACK_PACKAGE_CONTACT "QVContentTagging <maintainers@qvcontenttagging.invalid>")
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_COMPONENTS_ALL runtime dev)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_NAME qvcontenttagging)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SECTION sound)
set(CPACK_DEBIAN_RUNTIME_DEBUGINFO_PACKAGE ON)
set(CPACK_DEBIAN_DEV_PACKAGE_NAME qvcontenttagging-dev)
set(CPACK_DEBIAN_DEV_PACKAGE_SECTION libdevel)
set(CPACK_COMPONENT_DEV_DEPENDS runtime)
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)
# The tool and the libraries name what they load, and dpkg-shlibdeps turns that into packages; but for the script
# engine, which is loaded by its name.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS "${PROJECT_BINARY_DIR}/src" "${PROJECT_BINARY_DIR}/contentdb")
string(REPLACE ".so." "-" CPACK_DEBIAN_RUNTIME_PACKAGE_DEPENDS "${QVCT_SCRIPT_ENGINE_LIBRARY}")
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_CONTROL_EXTRA "${PROJECT_BINARY_DIR}/triggers")
file(WRITE "${PROJECT_BINARY_DIR}/triggers" "activate-noawait ldconfig\n")
include(CPack)
