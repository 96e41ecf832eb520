# Language level, warnings and sanitizers: the same for every target of the build.
set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)
set(CMAKE_RUNTIME_OUTPUT_DIRECTORY ${CMAKE_BINARY_DIR}/bin)

# Presets share most of their objects' sources; a compiler cache, where there is one, saves the repeats.
find_program(CCACHE ccache)
if(CCACHE)
  set(CMAKE_C_COMPILER_LAUNCHER ${CCACHE})
  set(CMAKE_CXX_COMPILER_LAUNCHER ${CCACHE})
endif()

add_compile_options(-Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wsign-conversion -Wnon-virtual-dtor
                    -Wold-style-cast -Woverloaded-virtual -Werror)
# The PPD interface of libcups is marked deprecated and has no successor in libcups 2.
add_compile_options(-Wno-deprecated-declarations)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
  # Optimising, GCC 12 follows the paths of std::string, std::vector and std::variant wrongly, and warns of copies and
  # values that cannot be (its bugs 105651, 105562, 105329). Newer ones and clang keep these warnings.
  add_compile_options(-Wno-restrict -Wno-maybe-uninitialized -Wno-array-bounds -Wno-stringop-overflow
                      -Wno-stringop-overread)
endif()

if(VENTRAS_SANITIZER)
  add_compile_options(-fsanitize=${VENTRAS_SANITIZER} -fno-omit-frame-pointer -fno-sanitize-recover=all)
  add_link_options(-fsanitize=${VENTRAS_SANITIZER})
endif()
if(VENTRAS_FUZZ)
  # Coverage for the code under test; each fuzz target adds the driver's main().
  add_compile_options(-fsanitize=fuzzer-no-link)
endif()
