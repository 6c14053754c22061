// Shared pieces of the command line's subcommands: option parsing (on CLI11), number parsing,
// finding the plug-in module, and the error type that becomes one line on stderr.
#pragma once

#include <cstdint>
#include <map>
#include <stdexcept>
#include <string>
#include <vector>

#include "refhost/gl/gl_context.h"

namespace veltrane_cli {

// Bad command-line input; the dispatcher prints it as one line and exits with status 2.
class UsageError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

struct OptionDefinition {
  std::string name;  // "--plugin"
  bool takesValue = false;
  // May be given more than once: the values are kept, in order, joined by ';'.
  bool repeatable = false;
};

// Options seen, by name; a flag maps to "". Accepts "--name value" and "--name=value".
// Throws UsageError for an unknown option, a missing value or a positional argument.
std::map<std::string, std::string> parseOptions(const std::vector<std::string>& args,
                                                const std::vector<OptionDefinition>& definitions);

struct Arguments {
  std::map<std::string, std::string> options;  // as parseOptions gives them
  std::vector<std::string> positional;         // the other arguments, in order
};

// As parseOptions, but arguments that do not start with '-' are collected instead of refused.
Arguments parseArguments(const std::vector<std::string>& args,
                         const std::vector<OptionDefinition>& definitions);

bool wantsHelp(const std::vector<std::string>& args);  // "-h" or "--help" anywhere

// The whole text as a decimal i32; throws UsageError naming the option otherwise.
int32_t parseInt32(const std::string& option, const std::string& text);

// "--profile core" (the default) or "--profile compat"; throws UsageError otherwise.
refhost::GlProfile glProfile(const std::map<std::string, std::string>& options);

// The module to load: the --plugin value when given, else $VELTRANE_PLUGIN when set and not
// empty, else the module installed beside the command (<dir of executable>/../lib/veltrane.so).
std::string pluginPath(const std::map<std::string, std::string>& options);
std::string installedPluginPath();

// A failure to load the module with, after it, where the path came from (the last pluginPath()
// asked) and how to name another; other messages unchanged.
std::string withModuleHint(const std::string& message);

}  // namespace veltrane_cli
