// What every command that writes rendered frames shares (`render`, `split`): the output
// options and their checks, the sound, the output's folder, and the run through the render
// loop into the writers with progress.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "cli/cli_support.h"
#include "scene/scene_document.h"

namespace veltrane_cli {

// The output options, with the text their help shows.
extern const std::vector<OptionDefinition> kRenderOutputOptions;
extern const char kRenderOutputHelp[];

// Takes "--audio-from FILE" and "--audio-from layer NAME" out of the arguments (the layer form
// is two words) and keeps them for renderScene; call before parsing the rest.
struct AudioFrom {
  enum class Kind { None, File, Layer };
  Kind kind = Kind::None;
  std::string name;
};
AudioFrom takeAudioFrom(std::vector<std::string>& args);

// The output's name from -o/--output; UsageError when it is missing, given twice or not an
// output kind.
std::string outputName(const std::map<std::string, std::string>& options);

// Checks the output options against the output and the scene, then renders the scene's frames
// (all, or --frame N / --frames A-B) into the output: a still, a sequence or a video with its
// codec, quality, bit depth and sound. Prints "wrote ..." and returns the exit status.
// `command` names the command in notes ("render", "split"); `notes` are printed as such once
// the output is accepted, before the frames.
int renderScene(const Scene& scene, const std::map<std::string, std::string>& options,
                const AudioFrom& audioFrom, const std::string& command,
                const std::vector<std::string>& notes = {});

}  // namespace veltrane_cli
