# Holds the folders of src/ to their order: each may include from itself and those above it only.
# Run as: cmake -DSOURCE=<src> -P CheckIncludes.cmake
cmake_minimum_required(VERSION 3.25)

set(rooms platform resources taxonomy metadata formats analysis autotagging indexing)
# One exception, by design: the rhythm service implements the protocol of tagging services.
set(allowed "analysis>autotagging/QVCTAutoTaggingService.h" "analysis>autotagging/TagDictionary.h")

set(faults "")
set(visible "")
foreach(room IN LISTS rooms)
  list(APPEND visible ${room})
  file(GLOB_RECURSE files "${SOURCE}/${room}/*.h" "${SOURCE}/${room}/*.cpp")
  foreach(file IN LISTS files)
    file(STRINGS "${file}" includes REGEX "^#include \"[a-z]+/")
    foreach(line IN LISTS includes)
      string(REGEX REPLACE "^#include \"([^\"]+)\".*" "\\1" header "${line}")
      string(REGEX REPLACE "/.*" "" target "${header}")
      if(target IN_LIST rooms AND NOT target IN_LIST visible AND NOT "${room}>${header}" IN_LIST allowed)
        string(APPEND faults "${file}: a file of ${room}/ may not include ${header}\n")
      endif()
    endforeach()
  endforeach()
endforeach()
if(faults)
  message(FATAL_ERROR "${faults}")
endif()
