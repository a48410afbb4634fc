# Turns the pattern pictures in resources/ into a C++ source, while configuring: no program of ours has to run on the
# build machine, so cross builds need nothing special.

set(QELT_RESOURCE_DIR ${CMAKE_CURRENT_LIST_DIR}/../resources)

# The pixels of an 8-bit PGM of exactly width x height, as a C++ initialiser list.
function(qelt_pgm_as_bytes out picture width height)
  file(READ ${picture} hex HEX)
  string(HEX "P5\n${width} ${height}\n255\n" header)
  string(LENGTH ${header} headerLength)
  math(EXPR pixelsLength "2 * ${width} * ${height}")
  math(EXPR expectedLength "${headerLength} + ${pixelsLength}")
  string(LENGTH ${hex} length)
  string(FIND ${hex} ${header} headerAt)
  if(NOT length EQUAL expectedLength OR NOT headerAt EQUAL 0)
    message(FATAL_ERROR "${picture}: not a plain 8-bit PGM of ${width} x ${height}")
  endif()
  string(SUBSTRING ${hex} ${headerLength} -1 hex)
  string(REGEX REPLACE "(..)" "0x\\1," bytes ${hex})
  string(REPEAT "....." 20 line)
  string(REGEX REPLACE "(${line})" "\\1\n    " bytes ${bytes})
  set(${out} "${bytes}" PARENT_SCOPE)
endfunction()

# Writes the source that defines the symbols of render/PatternTextures.h; its path comes back in `out`. Changing a picture
# configures the build anew.
function(qelt_embed_patterns out)
  set(grain ${QELT_RESOURCE_DIR}/paper-grain.pgm)
  set(stamps ${QELT_RESOURCE_DIR}/stamp-shapes.pgm)
  set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${grain} ${stamps})
  qelt_pgm_as_bytes(grainBytes ${grain} 150 150)
  qelt_pgm_as_bytes(stampBytes ${stamps} 100 300)
  set(source ${CMAKE_CURRENT_BINARY_DIR}/Patterns.cpp)
  # Written only when it differs, so that configuring does not cause compiling.
  file(CONFIGURE OUTPUT ${source} CONTENT "#include \"render/PatternTextures.h\"

namespace Qelt {

const unsigned char g_backgroundPtn[22500] = {
    @grainBytes@};

const unsigned char g_pointPtn[30000] = {
    @stampBytes@};

}  // namespace Qelt
" @ONLY)
  set(${out} ${source} PARENT_SCOPE)
endfunction()
