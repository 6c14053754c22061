// Building blocks for assembling GLSL sources from the shared identifier table, so that every
// declared name is spelled in one place.
#pragma once

#include <initializer_list>
#include <string>

#include "shaders/shader_identifiers.h"

namespace veltrane {
namespace shaders {

inline constexpr char kVersionLine[] = "#version 410";

// An identifier as a string, so that a source line can be concatenated around it.
inline std::string name(const char* identifier) { return identifier; }

inline std::string uniform(const char* type, const char* identifier) {
  return std::string("uniform ") + type + " " + identifier + ";";
}
inline std::string input(const char* type, const char* identifier) {
  return std::string("in ") + type + " " + identifier + ";";
}
inline std::string output(const char* type, const char* identifier) {
  return std::string("out ") + type + " " + identifier + ";";
}
// The single fragment output every program writes.
inline std::string colourOutput() {
  return std::string("layout(location = 0) out vec4 ") + shader_ids::kFragColour + ";";
}

// Joins source lines, each ended by a newline.
inline std::string lines(std::initializer_list<std::string> sourceLines) {
  std::string text;
  for (const std::string& line : sourceLines) text += line + "\n";
  return text;
}

}  // namespace shaders
}  // namespace veltrane
