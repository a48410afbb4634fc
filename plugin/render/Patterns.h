#pragma once

namespace Qelt {

// The two patterns of the pencil, one byte a pixel, row by row from the top, no header. Only read; live as
// long as the library. The host and the shaders see them as the red channel of a texture.
//
// The bytes come from the pictures in resources/ when the build is configured (cmake/EmbedPatterns.cmake);
// how those are made, and the statistics they keep, stands in docs/grain.md.

// The paper grain: one picture of 150 x 150, values 2 to 243. High is a peak of the paper, which takes the
// graphite; low is a pit, which stays white. Its edges meet without a seam.
extern const unsigned char g_backgroundPtn[22500] __attribute__((visibility("default")));

// Three round stamp shapes of 100 x 100, one after another: a flat core, a grainy rim, 0 outside the circle.
// The shaders draw where a byte is not 0.
extern const unsigned char g_pointPtn[30000] __attribute__((visibility("default")));

}  // namespace Qelt
