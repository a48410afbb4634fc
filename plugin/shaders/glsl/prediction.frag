#version 300 es
precision highp float;

in vec2 fragCoord;
flat in float secAlpha;
flat in float drawFactor;
flat in float pointOffset;
flat in vec2 penOrientation;
flat in float innerRadius;
flat in float alphaByWidth;

uniform sampler2D sampler0;  // paper grain
uniform sampler2D sampler1;  // squares of paper grain, one above the other, in place of stamp shapes
uniform vec4 inputColor;
uniform vec2 grainOffset;  // window pixels
uniform float numTilesOfPoints;
uniform float textureHeight;  // of the grain, window pixels
uniform float textureWidth;
uniform float inputOpacity;  // of the whole prediction

out vec4 FragColor;

void main() {
  const vec2 center = vec2(0.5, 0.5);
  const float radius = 0.5;

  float dist = distance(center, fragCoord);

  float pointAlpha = texture(sampler1, vec2(fragCoord.x, ((1.0 - fragCoord.y) + pointOffset) / numTilesOfPoints)).r;
  if (pointAlpha == 0.0) discard;

  // Kept: the square only decides which fragments exist; its value is not multiplied in.
  vec2 grainCoord = vec2((gl_FragCoord.x - grainOffset.x) / textureWidth, (gl_FragCoord.y - grainOffset.y) / textureHeight);
  float alpha = texture(sampler0, grainCoord).r * secAlpha;
  if (alpha == 0.0) discard;

  // The pen's orientation narrows the stamp to a band along it, and shades it across.
  float dx = fragCoord.x - center.x;
  float dy = (1.0 - fragCoord.y) - center.y;
  float len = dx * dx + dy * dy;
  float d = dx * penOrientation.x + dy * penOrientation.y;
  float pLen = sqrt(max(len - d * d, 0.0));
  if (pLen > drawFactor) discard;
  alpha *= (1.0 - (d + 0.5)) * ((drawFactor - pLen) / drawFactor);
  alpha = clamp(alpha, 0.0, 1.0);
  if (alpha == 0.0) discard;

  // Not clamped: outside the radius the ramp goes below zero, and the target clamps what is written.
  float smoothAlpha = alphaByWidth;
  if (dist > innerRadius) smoothAlpha *= 1.0 - (dist - innerRadius) / (radius - innerRadius);
  FragColor = vec4(inputColor.rgb, alpha * smoothAlpha * inputOpacity);
}
