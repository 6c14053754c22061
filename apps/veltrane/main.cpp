// `veltrane`: a small dispatcher that hands the arguments after the subcommand's name to it and
// turns any error into one line on stderr and a non-zero exit status.
#include <cstdio>
#include <exception>
#include <new>
#include <string>
#include <vector>

#include "cli/cli_support.h"
#include "cli/stop_signals.h"
#include "commands/commands.h"
#include "refhost/media/ffmpeg_utilities.h"

namespace {

using veltrane_cli::Command;

const Command kCommands[] = {
    {"info", "show the module's registration and the parameter panel it declares",
     &veltrane_cli::runInfo},
    {"render", "render frames of a scene to a still image, an image sequence or a video",
     &veltrane_cli::runRender},
    {"split", "put your own clips side by side along angled cuts, in one command",
     &veltrane_cli::runSplit},
    {"interact", "replay viewer events (pointer, keys, menus, undo) on a scene",
     &veltrane_cli::runInteract},
    {"bench", "measure milliseconds per frame across frame sizes and cut counts",
     &veltrane_cli::runBench},
    {"soak", "render a scene's frames many times over and watch resident memory",
     &veltrane_cli::runSoak},
    {"view", "open a scene in a window: picture, handles, parameter panel, timeline, undo",
     &veltrane_cli::runView},
    {"plan", "divide a render into chunks that machines of a render farm render apart",
     &veltrane_cli::runPlan},
    {"assemble", "join the rendered chunks of a plan into the final video",
     &veltrane_cli::runAssemble},
};

void printUsage(std::FILE* out) {
  std::fprintf(out,
               "Usage: veltrane <command> [options]\n"
               "\n"
               "Loads the Veltrane plug-in module into the reference host and drives it.\n"
               "\n"
               "Commands:\n");
  for (const Command& command : kCommands)
    std::fprintf(out, "  %-10s %s\n", command.name, command.summary);
  std::fprintf(out,
               "\n"
               "Run 'veltrane <command> --help' for the options of a command.\n"
               "The module is found with --plugin PATH, else $VELTRANE_PLUGIN, else\n"
               "<dir of veltrane>/../lib/veltrane.so.\n");
}

}  // namespace

int main(int argc, char** argv) {
  std::vector<std::string> args(argv + 1, argv + argc);
  if (args.empty()) {
    printUsage(stderr);
    return 2;
  }
  if (args[0] == "-h" || args[0] == "--help" || args[0] == "help") {
    printUsage(stdout);
    return 0;
  }
  const Command* chosen = nullptr;
  for (const Command& command : kCommands) {
    if (args[0] == command.name) chosen = &command;
  }
  if (!chosen) {
    std::fprintf(stderr, "veltrane: unknown command '%s' (see 'veltrane --help')\n",
                 args[0].c_str());
    return 2;
  }
  std::vector<std::string> rest(args.begin() + 1, args.end());
  // This program owns standard error: FFmpeg's messages go into the one line of a failure
  // instead of around it.
  refhost::keepLibraryErrorsForMessages();
  try {
    return chosen->run(rest);
  } catch (const veltrane_cli::UsageError& error) {
    std::fprintf(stderr, "veltrane %s: %s (see 'veltrane %s --help')\n", chosen->name, error.what(),
                 chosen->name);
    return 2;
  } catch (const veltrane_cli::Stopped& stop) {
    std::fprintf(stderr, "veltrane %s: %s\n", chosen->name, stop.what());
    return 128 + stop.signal();  // as a shell reports a process ended by the signal
  } catch (const std::bad_alloc&) {
    std::fprintf(stderr, "veltrane %s: out of memory\n", chosen->name);
    return 1;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "veltrane %s: %s\n", chosen->name, error.what());
    return 1;
  }
}
