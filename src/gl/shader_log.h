// Collects the GL info logs of one registry operation and, when the host asked for verbose
// diagnostics, prints them once at the end if they mention a warning or an error.
#pragma once

#include <string>

namespace veltrane {

class ShaderLog {
 public:
  explicit ShaderLog(bool verbose) : verbose_(verbose) {}
  // Prints on the way out, also while a compile or link exception passes, so the log that
  // explains the failure is seen before the exception reaches the host.
  ~ShaderLog();
  ShaderLog(const ShaderLog&) = delete;
  ShaderLog& operator=(const ShaderLog&) = delete;

  // Empty logs are ignored; consecutive logs are separated by one newline.
  void append(const std::string& log);
  const std::string& text() const { return text_; }

 private:
  std::string text_;
  bool verbose_;
};

// True when the text mentions "WARNING" or "ERROR" in any letter case.
bool mentionsWarningOrError(const std::string& text);

}  // namespace veltrane
