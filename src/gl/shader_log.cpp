// Printing rule of the GLSL info logs: only verbose hosts see them, and only logs that report
// a problem; a clean compile stays silent.
#include "gl/shader_log.h"

#include <iostream>

namespace veltrane {

bool mentionsWarningOrError(const std::string& text) {
  std::string upper = text;
  for (char& c : upper) {
    if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
  }
  return upper.find("WARNING") != std::string::npos || upper.find("ERROR") != std::string::npos;
}

ShaderLog::~ShaderLog() {
  if (verbose_ && !text_.empty() && mentionsWarningOrError(text_)) {
    std::cout << text_ << std::flush;
  }
  text_.clear();
}

void ShaderLog::append(const std::string& log) {
  if (log.empty()) return;
  if (!text_.empty()) text_ += '\n';
  text_ += log;
}

}  // namespace veltrane
