// Spawning the command line with redirected output, and the scene its tests share.
#include "cli_runner.h"

#include <fcntl.h>
#include <spawn.h>
#include <stdlib.h>
#include <sys/wait.h>
#include <unistd.h>

#include <fstream>
#include <iterator>

#include "support/temp_paths.h"

extern char** environ;

std::string slurp(const std::string& path) {
  std::ifstream file(path);
  return std::string(std::istreambuf_iterator<char>(file), {});
}

void writeText(const std::string& path, const std::string& text) {
  std::ofstream file(path);
  file << text;
}

CliRun runCli(const std::vector<std::string>& args, const char* plugin,
              const std::function<void(int)>& whileRunning) {
  const std::string outFile = testsupport::makeTempFile("veltrane_cli_out_");
  const std::string errFile = testsupport::makeTempFile("veltrane_cli_err_");
  const char* outPath = outFile.c_str();
  const char* errPath = errFile.c_str();
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, outPath, O_WRONLY | O_TRUNC, 0);
  posix_spawn_file_actions_addopen(&actions, 2, errPath, O_WRONLY | O_TRUNC, 0);

  std::vector<std::string> environment;
  for (char** entry = environ; *entry; ++entry) {
    const std::string name = std::string(*entry).substr(0, std::string(*entry).find('='));
    if (name != "VELTRANE_PLUGIN" && name != "DISPLAY" && name != "WAYLAND_DISPLAY")
      environment.push_back(*entry);
  }
  environment.push_back(std::string("VELTRANE_PLUGIN=") + plugin);
  std::vector<std::string> argStorage{VELTRANE_CLI_PATH};
  argStorage.insert(argStorage.end(), args.begin(), args.end());
  std::vector<char*> argv, envp;
  for (std::string& arg : argStorage) argv.push_back(arg.data());
  for (std::string& entry : environment) envp.push_back(entry.data());
  argv.push_back(nullptr);
  envp.push_back(nullptr);

  CliRun run;
  pid_t pid = 0;
  if (posix_spawn(&pid, VELTRANE_CLI_PATH, &actions, nullptr, argv.data(), envp.data()) == 0) {
    if (whileRunning) whileRunning(pid);
    int status = 0;
    waitpid(pid, &status, 0);
    run.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }
  posix_spawn_file_actions_destroy(&actions);
  run.out = slurp(outPath);
  run.err = slurp(errPath);
  unlink(outPath);
  unlink(errPath);
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
