# veldrin_sources(target [SOURCES ...] [HEADERS ...] [INTERNAL ...])
#
# Adds the files of the calling folder to a library. SOURCES are compiled, HEADERS are installed and each compiled
# alone, INTERNAL headers stay in the source tree. Paths are relative to the calling folder.
function(veldrin_sources target)
  cmake_parse_arguments(arg "" "" "SOURCES;HEADERS;INTERNAL" ${ARGN})
  if(arg_UNPARSED_ARGUMENTS)
    message(FATAL_ERROR "veldrin_sources: stray arguments '${arg_UNPARSED_ARGUMENTS}'")
  endif()
  list(TRANSFORM arg_SOURCES PREPEND ${CMAKE_CURRENT_SOURCE_DIR}/)
  list(TRANSFORM arg_HEADERS PREPEND ${CMAKE_CURRENT_SOURCE_DIR}/)
  list(TRANSFORM arg_INTERNAL PREPEND ${CMAKE_CURRENT_SOURCE_DIR}/)
  target_sources(${target} PRIVATE ${arg_SOURCES} ${arg_INTERNAL})
  if(arg_HEADERS)
    target_sources(${target} PUBLIC FILE_SET HEADERS FILES ${arg_HEADERS})
  endif()
endfunction()
