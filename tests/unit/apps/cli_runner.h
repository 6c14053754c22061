// Runs the `veltrane` command line as a separate process and captures what it printed; the
// small scene most of its tests render.
#pragma once

#include <functional>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "support/files.h"
#include "support/temp_paths.h"

using testsupport::commandOutput;
using testsupport::ScratchDirectory;
using testsupport::slurp;
using testsupport::writeText;

struct CliRun {
  int status = -1;  // exit status; -1 when the process did not exit normally
  std::string out;
  std::string err;
};

// Runs the command line with the arguments, without a display and with VELTRANE_PLUGIN naming
// `plugin` (the built module unless told). `whileRunning`, when given, gets the process id
// before the wait.
CliRun runCli(const std::vector<std::string>& args, const char* plugin = VELTRANE_MODULE_PATH,
              const std::function<void(int)>& whileRunning = nullptr);

extern const char kLayerA[];
// 64x36 at 25 fps with one layer (A), showing the pattern: one vertical Local cut near the right
// edge and no border, so both regions show the own source unmoved and the output is the source.
nlohmann::json smallScene(const std::string& pattern, int frames = 10);
// Writes the scene as the folder's scene.json; returns its path.
std::string writeScene(const ScratchDirectory& folder, const nlohmann::json& scene);
