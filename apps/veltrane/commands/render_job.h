// What every command that writes rendered frames shares (`render`, `split`): the output
// options and their checks, the sound, the output's folder, and the run through the render
// loop into the writers with progress.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "cli/cli_support.h"
#include "commands/render_sound.h"
#include "refhost/pipeline/frame_output.h"
#include "scene/scene_document.h"

namespace veltrane_cli {

// The output options, with the text their help shows.
extern const std::vector<OptionDefinition> kRenderOutputOptions;
extern const char kRenderOutputHelp[];

// The output's name from -o/--output; UsageError when it is missing, given twice or not an
// output kind.
std::string outputName(const std::map<std::string, std::string>& options);

// Frames first to last of the composition.
struct FrameRange {
  int32_t first = 0;
  int32_t last = 0;
  int32_t count() const { return last - first + 1; }
};

// What a render writes: the output with its encoding, the frames, and the sound a video
// carries over their time.
struct RenderJob {
  refhost::OutputTarget target;
  FrameRange frames;
  SoundChoice sound;
  // A damaged frame fails the job instead of being concealed.
  bool strict = false;
};

// Checks the output options against the output and the scene and settles the job they ask
// for: a still, a sequence or a video with its codec, quality, bit depth and sound, of every
// frame or of --frame N / --frames A-B. Throws UsageError naming the option.
RenderJob chooseRenderJob(const Scene& scene, const std::map<std::string, std::string>& options,
                          const AudioFrom& audioFrom);

// Renders the job's frames into its output with the context, module, progress and call log the
// options ask for. Prints "wrote ..." and returns the exit status; a note says why a video is
// silent, a warning which clips had damaged frames, concealed (with --strict a damaged frame
// fails the job instead). `command` names the command in notes ("render", "split").
int runRenderJob(const Scene& scene, const RenderJob& job,
                 const std::map<std::string, std::string>& options, const std::string& command);

// chooseRenderJob, then runRenderJob.
int renderScene(const Scene& scene, const std::map<std::string, std::string>& options,
                const AudioFrom& audioFrom, const std::string& command);

}  // namespace veltrane_cli
