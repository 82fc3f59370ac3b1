# Warnings of everything built from this folder on: libraries, tool, tests, and each installed header on its own.
option(VELDRIN_WARNINGS_AS_ERRORS "Treat warnings as errors" OFF)

add_compile_options(-Wall -Wextra -Wpedantic -Wconversion -Wshadow)
if(VELDRIN_WARNINGS_AS_ERRORS)
  add_compile_options(-Werror)
endif()
