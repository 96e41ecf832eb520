# What nearly every file includes, compiled once, for half of a build's time goes there: always for the tests, for the rest
# where a preset asks for it. The preset "debug" does not: it shows that each file of the product includes what it uses.
set(standard_headers <algorithm> <array> <chrono> <cstdint> <filesystem> <fstream> <functional> <map> <memory> <mutex>
                     <optional> <set> <span> <string> <string_view> <thread> <utility> <variant> <vector>)

# precompile_folders(NAME HEADERS header... FOLDERS folder...): for every C++ target of the folders and below them.
function(precompile_folders name)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "HEADERS;FOLDERS")
  file(WRITE ${CMAKE_CURRENT_BINARY_DIR}/${name}.cpp "")
  add_library(${name} OBJECT ${CMAKE_CURRENT_BINARY_DIR}/${name}.cpp)
  target_precompile_headers(${name} PRIVATE ${arg_HEADERS})
  # What some libraries ask for has to hold for all, or the compiler refuses the sharing.
  set(shared_options -pthread -DGTEST_HAS_PTHREAD=1)
  target_compile_options(${name} PRIVATE ${shared_options})
  while(arg_FOLDERS)
    list(POP_FRONT arg_FOLDERS folder)
    get_property(below DIRECTORY ${folder} PROPERTY SUBDIRECTORIES)
    list(APPEND arg_FOLDERS ${below})
    get_property(targets DIRECTORY ${folder} PROPERTY BUILDSYSTEM_TARGETS)
    foreach(target IN LISTS targets)
      get_target_property(type ${target} TYPE)
      if(type MATCHES "EXECUTABLE|STATIC_LIBRARY" AND NOT target STREQUAL name)
        target_precompile_headers(${target} REUSE_FROM ${name})
        target_compile_options(${target} PRIVATE ${shared_options})
      endif()
    endforeach()
  endwhile()
endfunction()
