#version 300 es
precision highp float;

in vec2 fragCoord;
flat in vec2 penOrientation;
flat in float widthFactor;

uniform sampler2D pointTexture;
uniform vec4 uInputColor;

out vec4 FragColor;

void main() {
  const vec2 center = vec2(0.5, 0.5);
  const float radius = 0.5;

  // Before the first discard: derivatives are undefined after it.
  float d = distance(center, fragCoord);
  float e = fwidth(d);

  if (texture(pointTexture, fragCoord).a == 0.0) discard;

  // The pen's orientation narrows the stamp to a slab along it.
  float dx = fragCoord.x - center.x;
  float dy = (1.0 - fragCoord.y) - center.y;
  float along = dx * penOrientation.x + dy * penOrientation.y;
  float p = sqrt(max(dx * dx + dy * dy - along * along, 0.0));
  if (p > widthFactor) discard;

  float coverage = 1.0 - clamp((d - (radius - e)) / e, 0.0, 1.0);
  FragColor = vec4(uInputColor.rgb, coverage);
}
