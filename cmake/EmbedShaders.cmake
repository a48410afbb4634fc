# qelt_embed_shaders(<out> [<class> <vertex> <fragment>]...): writes the definitions of each class's szVertexShader and
# szFragmentShader, the texts of those files in plugin/shaders/glsl, into one source in the build tree; <out> names it.
function(qelt_embed_shaders out)
  set(glsl ${PROJECT_SOURCE_DIR}/plugin/shaders/glsl)
  set(rows ${ARGN})
  set(definitions "")
  while(rows)
    list(POP_FRONT rows class vertex fragment)
    set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${glsl}/${vertex} ${glsl}/${fragment})
    file(READ ${glsl}/${vertex} vertexText)
    file(READ ${glsl}/${fragment} fragmentText)
    string(APPEND definitions "
const char ${class}::szVertexShader[] = R\"glsl(${vertexText})glsl\";
const char ${class}::szFragmentShader[] = R\"glsl(${fragmentText})glsl\";
")
  endwhile()
  set(cpp ${CMAKE_CURRENT_BINARY_DIR}/ShaderSources.cpp)
  file(CONFIGURE OUTPUT ${cpp} @ONLY CONTENT [[
#include "shaders/PencilShaders.h"

namespace Qelt {
@definitions@
}  // namespace Qelt
]])
  set(${out} ${cpp} PARENT_SCOPE)
endfunction()
