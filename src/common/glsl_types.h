// Plain records mirroring GLSL vec2 and vec4; a rectangle is a genVec4 (x0, y0, x1, y1).
#pragma once

namespace plugin_glsl_types {

struct genVec2 {
  float x = 0.0f;
  float y = 0.0f;
};

struct genVec4 {
  float x = 0.0f;
  float y = 0.0f;
  float z = 0.0f;
  float w = 0.0f;
};

}  // namespace plugin_glsl_types
