# qelt_embed_shader(<out> <class> <name>): writes the definitions of <class>::szVertexShader and szFragmentShader
# from plugin/shaders/glsl/<name>.vert and .frag into a source file in the build tree; <out> names it.
function(qelt_embed_shader out class name)
  set(glsl ${PROJECT_SOURCE_DIR}/plugin/shaders/glsl)
  set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${glsl}/${name}.vert ${glsl}/${name}.frag)
  file(READ ${glsl}/${name}.vert vertex)
  file(READ ${glsl}/${name}.frag fragment)
  set(cpp ${CMAKE_CURRENT_BINARY_DIR}/${class}Sources.cpp)
  file(CONFIGURE OUTPUT ${cpp} @ONLY CONTENT [[
#include "shaders/@class@.h"

namespace Qelt {

const char @class@::szVertexShader[] = R"glsl(@vertex@)glsl";

const char @class@::szFragmentShader[] = R"glsl(@fragment@)glsl";

}  // namespace Qelt
]])
  set(${out} ${cpp} PARENT_SCOPE)
endfunction()
