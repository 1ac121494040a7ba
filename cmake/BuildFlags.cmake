# The one interface target that every target of the project links: language level, warnings, sanitizers.
add_library(qvct_build_flags INTERFACE)
target_compile_features(qvct_build_flags INTERFACE cxx_std_20)
target_compile_options(qvct_build_flags INTERFACE -Wall -Wextra -Wpedantic -Wconversion -Wshadow)
if(QVCT_WARNINGS_AS_ERRORS)
  target_compile_options(qvct_build_flags INTERFACE -Werror)
endif()
# What is shipped carries only the functions that something calls: the tool and the shared libraries each link a part of
# the same objects.
set(shipped "$<CONFIG:Release,RelWithDebInfo,MinSizeRel>")
target_compile_options(qvct_build_flags INTERFACE "$<${shipped}:-ffunction-sections;-fdata-sections>")
target_link_options(qvct_build_flags INTERFACE "$<${shipped}:-Wl,--gc-sections,-z,pack-relative-relocs>")
# For code that runs once an item, or once a command, and inlines much: speed is decided elsewhere.
function(qvct_compile_for_size target)
  set_source_files_properties(${ARGN} TARGET_DIRECTORY ${target}
    PROPERTIES COMPILE_OPTIONS "$<$<CONFIG:Release,RelWithDebInfo>:-Os>")
endfunction()
if(QVCT_SANITIZERS)
  set(sanitize "-fsanitize=${QVCT_SANITIZERS}")
  target_compile_options(qvct_build_flags INTERFACE
    ${sanitize} -fno-sanitize-recover=all -fno-omit-frame-pointer)
  target_link_options(qvct_build_flags INTERFACE
    ${sanitize} "-Wl,--version-script=${CMAKE_CURRENT_LIST_DIR}/Sanitizers.map")
endif()

set(CMAKE_CXX_EXTENSIONS OFF)
# One set of objects makes the static and the shared libraries.
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)
set(QVCT_SHARED_LINK_OPTIONS -Wl,--as-needed)
if(NOT QVCT_SANITIZERS)  # whose own symbols come with the program
  list(APPEND QVCT_SHARED_LINK_OPTIONS -Wl,--no-undefined)
endif()
find_program(CCACHE ccache)
if(CCACHE)
  # Paths of the project count as they lie within it, so that every clone on a machine has the others' objects.
  set(CMAKE_CXX_COMPILER_LAUNCHER env "CCACHE_BASEDIR=${PROJECT_SOURCE_DIR}" CCACHE_NOHASHDIR=1 "${CCACHE}")
  set(CMAKE_C_COMPILER_LAUNCHER "${CMAKE_CXX_COMPILER_LAUNCHER}")
endif()
