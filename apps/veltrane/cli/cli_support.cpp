// Option parsing and module lookup shared by the subcommands.
#include "cli/cli_support.h"

#include <CLI/CLI.hpp>
#include <cctype>
#include <cerrno>
#include <climits>
#include <cstdlib>
#include <filesystem>

#include "cli/nearest_name.h"
#include "refhost/platform/shared_library.h"

namespace veltrane_cli {

std::map<std::string, std::string> parseOptions(const std::vector<std::string>& args,
                                                const std::vector<OptionDefinition>& definitions) {
  Arguments parsed = parseArguments(args, definitions);
  if (!parsed.positional.empty())
    throw UsageError("unexpected argument '" + parsed.positional.front() + "'");
  return parsed.options;
}

namespace {

// The option of `definitions` a CLI11 message is about: the longest name it mentions, with or
// without its dashes (CLI11 names a flag without them).
std::string optionNamedIn(const std::string& message,
                          const std::vector<OptionDefinition>& definitions) {
  std::string found;
  for (const OptionDefinition& definition : definitions) {
    std::string bare = definition.name.substr(definition.name.find_first_not_of('-'));
    if (message.find(bare) != std::string::npos && definition.name.size() > found.size())
      found = definition.name;
  }
  return found;
}

}  // namespace

Arguments parseArguments(const std::vector<std::string>& args,
                         const std::vector<OptionDefinition>& definitions) {
  CLI::App app;
  app.set_help_flag();  // each command prints its own help text
  app.allow_extras();   // unknown options are reported below, in the command line's words
  // Options are spelled the same everywhere: on Windows, "/path/file" is a path, not an option.
  app.allow_windows_style_options(false);
  Arguments parsed;
  std::vector<std::string> values(definitions.size());  // sized once: CLI11 keeps references
  std::vector<CLI::Option*> declared;
  for (std::size_t i = 0; i < definitions.size(); ++i) {
    const OptionDefinition& definition = definitions[i];
    declared.push_back(definition.takesValue
                           ? app.add_option(definition.name, values[i])
                                 ->multi_option_policy(definition.repeatable
                                                           ? CLI::MultiOptionPolicy::TakeAll
                                                           : CLI::MultiOptionPolicy::TakeLast)
                           : app.add_flag(definition.name)->disable_flag_override());
  }
  app.add_option("arguments", parsed.positional);
  std::vector<std::string> reversed(args.rbegin(), args.rend());  // CLI11 takes them last first
  try {
    app.parse(reversed);
  } catch (const CLI::ArgumentMismatch& error) {
    // A flag given a value ("--json=1") or an option given none ("--frame" at the end).
    bool flag = std::string(error.what()).find("flag override") != std::string::npos;
    throw UsageError("option '" + optionNamedIn(error.what(), definitions) +
                     (flag ? "' takes no value" : "' needs a value"));
  } catch (const CLI::ParseError& error) {
    throw UsageError(error.what());
  }
  for (const std::string& extra : app.remaining()) {
    if (extra.size() > 1 && extra[0] == '-') {
      const std::string option = extra.substr(0, extra.find('='));
      std::vector<std::string> names;
      for (const OptionDefinition& definition : definitions) names.push_back(definition.name);
      throw UsageError("unknown option '" + option + "'" + didYouMean(option, names));
    }
  }
  for (std::size_t i = 0; i < definitions.size(); ++i) {
    if (declared[i]->count() == 0) continue;
    if (definitions[i].repeatable) {
      // Joined as CLI11 met them, last given first: put them back in the order given.
      std::vector<std::string> given;
      for (const std::string& value : declared[i]->results()) given.insert(given.begin(), value);
      std::string joined;
      for (const std::string& value : given) joined += (joined.empty() ? "" : ";") + value;
      values[i] = joined;
    }
    parsed.options[definitions[i].name] = values[i];
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

namespace {

// Where the module's path came from, for the message when it cannot be loaded.
std::string pluginPathOrigin = "looked for beside the command";

}  // namespace

std::string pluginPath(const std::map<std::string, std::string>& options) {
  auto given = options.find("--plugin");
  if (given != options.end()) {
    if (given->second.empty()) throw UsageError("option '--plugin' needs a non-empty path");
    pluginPathOrigin = "named by --plugin";
    return given->second;
  }
  const char* environment = std::getenv("VELTRANE_PLUGIN");
  if (environment && *environment) {
    pluginPathOrigin = "named by $VELTRANE_PLUGIN";
    return environment;
  }
  pluginPathOrigin = "looked for beside the command, in ../lib";
  return installedPluginPath();
}

std::string withModuleHint(const std::string& message) {
  if (message.rfind("cannot load plug-in module '", 0) != 0) return message;
  return message + "; " + pluginPathOrigin +
         "; name the module with --plugin PATH or the VELTRANE_PLUGIN variable";
}

}  // namespace veltrane_cli
