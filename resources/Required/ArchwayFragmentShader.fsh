#version 120

// Resamples texture unit 0 for the fixed pipeline's texture coordinate 0.
//
// The texture is bound with GL_NEAREST, so each fetch returns exactly one
// texel and the interpolation is done here: Catmull-Rom, a bicubic over the
// 4 x 4 texels around the point, 16 fetches. It interpolates (at a texel's
// centre the result is that texel), keeps edges sharper than bilinear, and is
// continuous in value and slope. A B-spline is smoother but blurs, since it
// does not pass through the samples; its usual 4-fetch form leans on the
// hardware's bilinear filtering, which GL_NEAREST rules out anyway.
//
// Channels are interpolated as they are stored, as GL_LINEAR would, so the
// result matches the path without this shader. The texture may hold empty
// margins around the picture's pixels: beyond the picture's edge the result
// is transparent, never a repeat of the edge, and fetches the kernel needs
// beyond the edge take the edge texel, so the picture keeps a hard edge with
// no dark or transparent fringe inside, whether or not a tile has margins.
//
// The picture's edge, and the circle where the camera model's cover ends,
// are drawn anti-aliased: a pixel's share of the covered area comes from
// its distance to the nearer edge, measured in the result's own pixels
// through the screen derivatives, so the border is a smooth curve whatever
// the mesh's cells do there. The share scales the channels coverScale names
// (the alpha alone where the picture has transparency, every channel where
// the outside is plain black); past the edge every channel is 0.

uniform sampler2D source;
uniform vec2 texelSize;       // 1 / width, 1 / height
uniform vec2 textureSize;     // width, height in texels
uniform vec4 pictureTexels;   // first texel x, y and last texel x, y of the picture
uniform vec4 coverCircle;     // centre x, y and radius in texels; radius 0: none
uniform vec4 coverScale;      // 1 for each channel the covered share scales

vec4 Texel(vec2 index) {
  vec2 inside = clamp(index, pictureTexels.xy, pictureTexels.zw);
  return texture2D(source, (inside + vec2(0.5)) * texelSize);
}

// Catmull-Rom weights for the texels at -1, 0, 1, 2 from the one below p.
vec4 Weights(float t) {
  float t2 = t * t;
  float t3 = t2 * t;
  return vec4(-0.5 * t3 + t2 - 0.5 * t,
              1.5 * t3 - 2.5 * t2 + 1.0,
              -1.5 * t3 + 2.0 * t2 + 0.5 * t,
              0.5 * t3 - 0.5 * t2);
}

void main() {
  // Texel centres lie at whole numbers in p; the picture covers half a
  // texel beyond its first and last centres.
  vec2 p = gl_TexCoord[0].st * textureSize - vec2(0.5);
  // How far p moves per result pixel. It is smooth across the edges, where
  // a derivative of the distance itself would break at the corners.
  vec2 px = dFdx(p);
  vec2 py = dFdy(p);
  // Each edge's distance in result pixels: in texels over the texels per
  // pixel across it.
  vec2 across = max(vec2(length(vec2(px.x, py.x)), length(vec2(px.y, py.y))), vec2(1e-6));
  vec2 low = (p - (pictureTexels.xy - vec2(0.5))) / across;
  vec2 high = (pictureTexels.zw + vec2(0.5) - p) / across;
  float inside = min(min(low.x, low.y), min(high.x, high.y));
  if (coverCircle.z > 0.0) {
    vec2 off = p - coverCircle.xy;
    float away = length(off);
    vec2 outward = off / max(away, 1e-6);
    float moved = max(length(vec2(dot(outward, px), dot(outward, py))), 1e-6);
    inside = min(inside, (coverCircle.z - away) / moved);
  }
  float covered = clamp(0.5 + inside, 0.0, 1.0);

  vec2 base = floor(p);
  vec2 t = p - base;
  vec4 wx = Weights(t.x);
  vec4 wy = Weights(t.y);

  vec4 sum = vec4(0.0);
  for (int j = 0; j < 4; ++j) {
    vec4 row = wx.x * Texel(base + vec2(-1.0, float(j) - 1.0)) +
               wx.y * Texel(base + vec2(0.0, float(j) - 1.0)) +
               wx.z * Texel(base + vec2(1.0, float(j) - 1.0)) +
               wx.w * Texel(base + vec2(2.0, float(j) - 1.0));
    sum += wy[j] * row;
  }
  // The kernel's negative lobes overshoot near steps; stay within the
  // range a colour can have.
  vec4 colour = clamp(sum, 0.0, 1.0);
  gl_FragColor = covered > 0.0 ? mix(colour, colour * covered, coverScale) : vec4(0.0);
}
