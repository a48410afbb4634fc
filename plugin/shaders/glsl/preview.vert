#version 300 es
precision highp float;

layout(location = 0) in vec4 position;  // x, y in stroke units; u, v of the stamp
layout(location = 1) in vec3 index;     // stamp opacity, narrowing, stamp shape
layout(location = 2) in vec2 index2;    // pen orientation, unit vector

uniform mat4 ProjectionMatrix;

out vec2 fragCoord;
flat out float secAlpha;
flat out float drawFactor;
flat out float pointOffset;
flat out vec2 penOrientation;

void main() {
  gl_Position = ProjectionMatrix * vec4(position.x, position.y, 0.0, 1.0);
  fragCoord = vec2(position.z, position.w);
  secAlpha = index.x;
  drawFactor = 1.0 / (9.0 * index.y + 1.0);
  pointOffset = index.z;
  penOrientation = vec2(index2.x, index2.y);
}
