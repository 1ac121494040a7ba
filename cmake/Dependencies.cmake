# Everything the library calls but does not write itself. Their headers stay inside .cpp files.
find_package(PkgConfig REQUIRED)
find_package(ICU REQUIRED COMPONENTS uc i18n)
find_package(LibXml2 REQUIRED)
find_package(SQLite3 REQUIRED)
find_package(ZLIB REQUIRED)
find_package(fmt REQUIRED)
find_package(spdlog REQUIRED)
# Name and module of each; the installed package says the same to hosts that link the static library.
foreach(entry IN ITEMS kissfft:kissfft-float libplist:libplist-2.0
                       sndfile:sndfile uuid:uuid zstd:libzstd)
  string(REPLACE ":" ";" entry "${entry}")
  list(GET entry 0 name)
  list(GET entry 1 module)
  pkg_check_modules(${name} REQUIRED IMPORTED_TARGET ${module})
  string(APPEND QVCT_PKG_CONFIG_MODULES " ${module}")
  string(APPEND QVCT_PKG_CONFIG_CALLS "  pkg_check_modules(${name} REQUIRED IMPORTED_TARGET ${module})\n")
endforeach()
# Loaded while the program runs, when the first script does: only its headers are built with, and the name of its
# library with the version that they belong to.
pkg_check_modules(javascriptcore REQUIRED javascriptcoregtk-4.1)
find_library(QVCT_SCRIPT_ENGINE javascriptcoregtk-4.1 HINTS ${javascriptcore_LIBRARY_DIRS} REQUIRED)
file(REAL_PATH "${QVCT_SCRIPT_ENGINE}" engine_file)
string(REGEX MATCH "[^/]+[.]so[.][0-9]+" QVCT_SCRIPT_ENGINE_LIBRARY "${engine_file}")
if(QVCT_SANITIZERS)
  # The leak checker crashes over the thread-local variables of libraries that were loaded later.
  target_link_options(qvct_build_flags INTERFACE
    -Wl,--push-state,--no-as-needed "${QVCT_SCRIPT_ENGINE}" -Wl,--pop-state)
endif()
if(QVCT_BUILD_TOOL)
  find_package(CLI11 REQUIRED)
  find_package(nlohmann_json REQUIRED)
endif()
