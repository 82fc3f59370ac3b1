# Warnings of everything built from this folder on: libraries, tool, tests, and each installed header on its own.
option(VELDRIN_WARNINGS_AS_ERRORS "Treat warnings as errors" OFF)

add_compile_options(-Wall -Wextra -Wpedantic -Wconversion -Wshadow)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" AND CMAKE_CXX_COMPILER_VERSION VERSION_LESS 13)
  # GCC 12 takes the growth of an inlined std::string sum for an overlapping copy (its bug 105651).
  add_compile_options(-Wno-restrict)
endif()
if(VELDRIN_WARNINGS_AS_ERRORS)
  add_compile_options(-Werror)
endif()
