#pragma once

#include "base/HostApi.h"

namespace Qelt {

class GraphicsObject;
class OpenGLShaderProgram;
class VertexDescriptor;

// Makes GL objects. Render thread. Every maker returns null when it fails.
class QELT_HOST_API GraphicsFactory {
 public:
  static constexpr int kTriangles = 4;

  // `bufferCount` vertex buffers of the descriptor's layout. The pen passes (1, kTriangles, d, 0, 0).
  static GraphicsObject* createGraphicsObject(int bufferCount, int primitiveType,
                                              const VertexDescriptor& descriptor, int usage, int indexType);
  // Compiles and links; the sources must stay valid as long as the program, which is made again from them
  // after a context loss. `geometrySource` is null. A failure is logged.
  static OpenGLShaderProgram* createOpenGLShaderProgram(const char* vertexSource, const char* fragmentSource,
                                                        const char* geometrySource);
};

}  // namespace Qelt
