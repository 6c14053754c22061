// Spawning the command line with redirected output, and the scene its tests share.
#include "cli_runner.h"

#include <unistd.h>

#include "support/child_process.h"

CliRun runCli(const std::vector<std::string>& args, const char* plugin,
              const std::function<void(int)>& whileRunning) {
  std::vector<std::string> environment =
      testsupport::environmentWithout({"VELTRANE_PLUGIN", "DISPLAY", "WAYLAND_DISPLAY"});
  environment.push_back(std::string("VELTRANE_PLUGIN=") + plugin);
  std::vector<std::string> argv{VELTRANE_CLI_PATH};
  argv.insert(argv.end(), args.begin(), args.end());
  const std::string outPath = testsupport::makeTempFile("veltrane_cli_out_");
  const std::string errPath = testsupport::makeTempFile("veltrane_cli_err_");
  CliRun run;
  {
    testsupport::ChildProcess cli(argv, outPath, errPath, &environment);
    if (whileRunning) whileRunning(cli.pid());
    run.status = cli.wait(600);
  }
  run.out = slurp(outPath);
  run.err = slurp(errPath);
  unlink(outPath.c_str());
  unlink(errPath.c_str());
  return run;
}

const char kLayerA[] = "aaaaaaaa-0000-4000-8000-000000000001";

nlohmann::json smallScene(const std::string& pattern, int frames) {
  return {{"width", 64},
          {"height", 36},
          {"fps", 25},
          {"duration", frames},
          {"source", {{"pattern", pattern}}},
          {"layers", nlohmann::json::array({{{"guid", kLayerA}, {"name", "A"}}})},
          {"params", {{"cutPosition_0", {28, 0}}, {"cutDirection_0", 0}, {"borderWidth", 0}}}};
}

std::string writeScene(const ScratchDirectory& folder, const nlohmann::json& scene) {
  const std::string path = folder.file("scene.json");
  writeText(path, scene.dump());
  return path;
}
