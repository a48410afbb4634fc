#version 300 es
precision highp float;

layout(location = 0) in vec4 position;     // x, y in stroke units; u, v of the stamp
layout(location = 1) in float tiltFactor;  // 0 upright
layout(location = 2) in vec2 index2;       // pen orientation, unit vector

uniform mat4 uProjectionMatrix;
uniform float outlineCase;  // 0 the pass in the outline's colour, else the pass that erases

out vec2 fragCoord;
flat out vec2 penOrientation;
flat out float widthFactor;

void main() {
  gl_Position = uProjectionMatrix * vec4(position.x, position.y, 0.0, 1.0);
  fragCoord = vec2(position.z, position.w);
  penOrientation = vec2(index2.x, index2.y);
  // A tilted stamp is erased thinner than it is coloured.
  if (outlineCase == 0.0) {
    widthFactor = 1.0 / (6.0 * tiltFactor + 1.0);
  } else {
    widthFactor = 1.0 / (11.0 * tiltFactor + 1.0);
  }
}
