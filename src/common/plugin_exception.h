// The plug-in's own failure type: carries a static text and travels to Notify, which answers 5.
#pragma once

#include <exception>

namespace veltrane {

class PluginException : public std::exception {
 public:
  explicit PluginException(const char* text) noexcept : text_(text) {}
  const char* what() const noexcept override { return text_; }

 private:
  const char* text_;  // static storage; never freed
};

// The text of a declaration the host refused.
constexpr const char* kDeclarationRefused = "Plugin Error";

}  // namespace veltrane
