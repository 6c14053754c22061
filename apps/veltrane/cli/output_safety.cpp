// Checking outputs against inputs, against files already there, and against their folder.
#include "cli/output_safety.h"

#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <regex>

namespace veltrane_cli {
namespace {

namespace fs = std::filesystem;

// The same file through any path, link or hard link; names of files not there yet by the
// place they name.
bool sameFile(const fs::path& a, const fs::path& b) {
  std::error_code error;
  if (fs::exists(a, error) && fs::exists(b, error)) return fs::equivalent(a, b, error) && !error;
  return fs::weakly_canonical(a, error) == fs::weakly_canonical(b, error) && !error;
}

// The names a frame-number pattern makes in its folder: "f%04d.png" makes f0000.png, f12345.png.
std::regex namesMadeBy(const std::string& pattern) {
  static const std::regex number("%0?([0-9]*)d");
  static const std::regex special(R"([.^$|()\[\]{}*+?\\])");
  std::smatch found;
  std::string escaped = std::regex_replace(pattern, special, R"(\$&)");
  if (!std::regex_search(escaped, found, number)) return std::regex(escaped);
  const std::string digits = found[1].str().empty() ? "+" : "{" + found[1].str() + ",}";
  return std::regex(found.prefix().str() + "-?[0-9]" + digits + found.suffix().str());
}

bool isPattern(const std::string& output) {
  return std::regex_search(fs::path(output).filename().string(), std::regex("%0?[0-9]*d"));
}

// The nearest folder at or above the output's that is there: where a new file or folder goes.
fs::path nearestFolder(const std::string& output) {
  fs::path folder = fs::absolute(fs::path(output)).parent_path();
  std::error_code error;
  while (!folder.empty() && !fs::exists(folder, error) && folder != folder.root_path())
    folder = folder.parent_path();
  return folder;
}

// Why no new file can be made in the folder, or "" when one can: tried with a file of our own.
std::string refusesNewFiles(const fs::path& folder) {
  const fs::path probe =
      folder / (".veltrane-write-check-" + std::to_string(static_cast<long>(getpid())));
  errno = 0;
  std::ofstream file(probe.string(), std::ios::binary);
  const int why = errno;
  if (file.is_open()) {
    file.close();
    std::error_code ignored;
    fs::remove(probe, ignored);
    return "";
  }
  return why ? std::strerror(why) : "cannot create files there";
}

bool onTerminal() { return isatty(fileno(stdin)) && isatty(fileno(stderr)); }

}  // namespace

Replacing replacingChoice(const std::map<std::string, std::string>& options) {
  const bool yes = options.count("-y") || options.count("--overwrite");
  const bool no = options.count("-n") || options.count("--no-overwrite");
  if (yes && no) throw UsageError("give -y (replace outputs) or -n (keep them), not both");
  return yes ? Replacing::Yes : no ? Replacing::No : Replacing::Ask;
}

void refuseInputAsOutput(const std::string& option, const std::string& output,
                         const std::vector<std::string>& inputs) {
  // A pattern's output is every file of its folder that the pattern names, there already (an
  // input itself, or a link to one) or not.
  std::vector<fs::path> outputs{output};
  if (isPattern(output)) {
    outputs.clear();
    const fs::path folder =
        fs::path(output).parent_path().empty() ? fs::path(".") : fs::path(output).parent_path();
    const std::regex names = namesMadeBy(fs::path(output).filename().string());
    std::error_code error;
    for (fs::directory_iterator it(folder, error), end; !error && it != end; it.increment(error))
      if (std::regex_match(it->path().filename().string(), names)) outputs.push_back(it->path());
  }
  for (const std::string& input : inputs)
    for (const fs::path& written : outputs)
      if (sameFile(input, written))
        throw UsageError((option.empty() ? "" : "option '" + option + "': ") + output +
                         " is the input " + input +
                         "; name another output, it would be written over");
}

void checkOutputNames(const std::string& option, const std::string& shown,
                      const std::vector<std::string>& names, Replacing choice) {
  std::vector<std::string> there;
  for (const std::string& name : names) {
    std::error_code error;
    const fs::file_status status = fs::status(name, error);
    if (fs::is_directory(status))
      throw OutputRefused(name + ": is a folder; " + option + " names a file to write");
    if (fs::exists(status)) there.push_back(name);
  }
  if (!names.empty()) {
    const fs::path folder = nearestFolder(names.front());
    if (fs::is_directory(folder))
      if (const std::string why = refusesNewFiles(folder); !why.empty())
        throw OutputRefused(shown + ": cannot write in " + folder.string() + ": " + why);
  }
  if (there.empty() || choice == Replacing::Yes) return;
  const std::string which =
      there.size() == 1 ? there.front()
                        : there.front() + " and " + std::to_string(there.size() - 1) +
                              " other file" + (there.size() == 2 ? "" : "s") + " of " + shown;
  const std::string verb = there.size() == 1 ? " exists" : " exist";
  if (choice == Replacing::No)
    throw OutputRefused(which + verb + "; kept as -n asks, nothing was written");
  if (!onTerminal())
    throw UsageError(which + verb + "; give -y to replace or -n to keep what is there");
  std::fprintf(stderr, "%s%s. Replace %s? [y/N] ", which.c_str(), verb.c_str(),
               there.size() == 1 ? "it" : "them");
  std::fflush(stderr);
  std::string answer;
  std::getline(std::cin, answer);
  if (answer != "y" && answer != "Y" && answer != "yes")
    throw OutputRefused(which + verb + "; not replaced, nothing was written");
}

}  // namespace veltrane_cli
