// Option parsing and module lookup shared by the subcommands.
#include "cli_support.h"

#include <cctype>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <filesystem>

#include "refhost/shared_library.h"

namespace veltrane_cli {

std::map<std::string, std::string> parseOptions(const std::vector<std::string>& args,
                                                const std::vector<OptionDefinition>& definitions) {
  Arguments parsed = parseArguments(args, definitions);
  if (!parsed.positional.empty())
    throw UsageError("unexpected argument '" + parsed.positional.front() + "'");
  return parsed.options;
}

Arguments parseArguments(const std::vector<std::string>& args,
                         const std::vector<OptionDefinition>& definitions) {
  Arguments parsed;
  std::map<std::string, std::string>& seen = parsed.options;
  for (std::size_t i = 0; i < args.size(); ++i) {
    const std::string& arg = args[i];
    if (arg.size() < 2 || arg[0] != '-') {
      parsed.positional.push_back(arg);
      continue;
    }
    std::string name = arg.substr(0, arg.find('='));
    const OptionDefinition* definition = nullptr;
    for (const OptionDefinition& candidate : definitions) {
      if (candidate.name == name) definition = &candidate;
    }
    if (!definition) throw UsageError("unknown option '" + name + "'");
    bool inlineValue = name.size() < arg.size();
    if (!definition->takesValue) {
      if (inlineValue) throw UsageError("option '" + name + "' takes no value");
      seen[name] = "";
    } else if (inlineValue) {
      seen[name] = arg.substr(name.size() + 1);
    } else {
      if (i + 1 >= args.size()) throw UsageError("option '" + name + "' needs a value");
      seen[name] = args[++i];
    }
  }
  return parsed;
}

bool wantsHelp(const std::vector<std::string>& args) {
  for (const std::string& arg : args) {
    if (arg == "-h" || arg == "--help") return true;
  }
  return false;
}

int32_t parseInt32(const std::string& option, const std::string& text) {
  errno = 0;
  char* end = nullptr;
  long long value = std::strtoll(text.c_str(), &end, 10);
  bool whole =
      !text.empty() && end && *end == '\0' && !std::isspace(static_cast<unsigned char>(text[0]));
  if (!whole || errno == ERANGE || value < INT32_MIN || value > INT32_MAX)
    throw UsageError("option '" + option + "' expects a whole number (32-bit), got '" + text + "'");
  return static_cast<int32_t>(value);
}

refhost::GlProfile glProfile(const std::map<std::string, std::string>& options) {
  auto given = options.find("--profile");
  if (given == options.end() || given->second == "core") return refhost::GlProfile::Core;
  if (given->second == "compat") return refhost::GlProfile::Compatibility;
  throw UsageError("option '--profile' expects core or compat, got '" + given->second + "'");
}

std::string installedPluginPath() {
#ifdef _WIN32
  constexpr const char* kModuleName = "veltrane.dll";
#else
  constexpr const char* kModuleName = "veltrane.so";
#endif
  const std::string executable = refhost::executablePath();
  if (executable.empty()) return kModuleName;
  return (std::filesystem::path(executable).parent_path() / ".." / "lib" / kModuleName)
      .lexically_normal()
      .string();
}

std::string pluginPath(const std::map<std::string, std::string>& options) {
  auto given = options.find("--plugin");
  if (given != options.end()) {
    if (given->second.empty()) throw UsageError("option '--plugin' needs a non-empty path");
    return given->second;
  }
  const char* environment = std::getenv("VELTRANE_PLUGIN");
  if (environment && *environment) return environment;
  return installedPluginPath();
}

}  // namespace veltrane_cli
