# What the libraries themselves are built with. None of it shows in an installed header or in the exported targets:
# whoever uses the libraries needs their shared objects at run time and nothing at build time.
find_package(TBB REQUIRED)

# The packages' own config files are not used: one of them demands Boost, which the part used here does without.
function(veldrin_system_library target header library)
  find_path(${target}_INCLUDE_DIR ${header} REQUIRED)
  mark_as_advanced(${target}_INCLUDE_DIR)
  add_library(veldrin_${target} INTERFACE)
  target_include_directories(veldrin_${target} SYSTEM INTERFACE ${${target}_INCLUDE_DIR})
  if(library)
    find_library(${target}_LIBRARY ${library} REQUIRED)
    mark_as_advanced(${target}_LIBRARY)
    target_link_libraries(veldrin_${target} INTERFACE ${${target}_LIBRARY})
  endif()
  add_library(veldrin::${target} ALIAS veldrin_${target})
endfunction()

veldrin_system_library(msgpack msgpack.hpp "")
target_compile_definitions(veldrin_msgpack INTERFACE MSGPACK_NO_BOOST MSGPACK_DEFAULT_API_VERSION=1)
veldrin_system_library(blosc blosc.h blosc)
veldrin_system_library(xxhash xxhash.h xxhash)
