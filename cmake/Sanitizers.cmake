# VELDRIN_SANITIZE names the sanitizers of this build; the first report ends the program, so that no test passes over
# one.
set(VELDRIN_SANITIZE "" CACHE STRING "Sanitizers, separated by semicolons: address, undefined, thread")

if(VELDRIN_SANITIZE)
  list(JOIN VELDRIN_SANITIZE "," sanitizers)
  # -O1 keeps stacks readable and the tests at a bearable speed.
  add_compile_options(-O1 -g -fno-omit-frame-pointer -fsanitize=${sanitizers} -fno-sanitize-recover=all)
  add_link_options(-fsanitize=${sanitizers})
  if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    # In instrumented code GCC takes sound initialisations for missing ones, even inside the standard library.
    add_compile_options(-Wno-maybe-uninitialized)
  endif()
  unset(sanitizers)
endif()

if(VELDRIN_BUILD_FUZZ)
  if(NOT CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    message(FATAL_ERROR "The fuzz drivers need clang's libFuzzer; configure with the preset 'fuzz'.")
  endif()
  # Coverage counters go into the libraries, the fuzzing loop itself into the drivers only.
  add_compile_options(-fsanitize=fuzzer-no-link)
endif()
