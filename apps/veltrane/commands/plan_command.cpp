// `veltrane plan`: divides a render job into chunks that machines of a render farm render apart,
// writes the plan beside the final video and prints one command a chunk.
#include <cstdio>
#include <filesystem>

#include "cli/cli_support.h"
#include "commands/commands.h"
#include "commands/farm_plan.h"
#include "output/made_folder.h"
#include "refhost/platform/shared_library.h"
#include "scene/scene_document.h"

namespace veltrane_cli {
namespace {

// Frames from one keyframe to the next in every chunk unless --gop says otherwise: the
// H.264 and H.265 encoders' own longest GOP.
constexpr int32_t kDefaultGop = 250;

const char kPlanHelp[] =
    "Usage: veltrane plan SCENE.json (--chunks N | --chunk-frames K) -o FINAL [--gop G]\n"
    "                     [render's output options]\n"
    "\n"
    "Divides the render of a scene into chunks that machines render apart and writes the plan,\n"
    "FINAL.plan.json: the scene's path and checksum, the final video and its settings, and each\n"
    "chunk's frames and file. Prints one command a chunk, for a shell loop, xargs -P or a\n"
    "scheduler (see docs/farm.md), and on stderr the assembly's command that joins them:\n"
    "  veltrane render --plan FINAL.plan.json --chunk I   renders chunk I (0 to N-1)\n"
    "  veltrane assemble FINAL.plan.json                  checks the chunks and writes FINAL\n"
    "FINAL is a video (.mp4, .mov, .mkv, .webm). The chunks are video only, each starting on a\n"
    "keyframe with closed GOPs, timed at their place in the job; the assembly copies them\n"
    "without encoding again and adds the sound a render of the whole job carries, once.\n"
    "\n"
    "Plan options:\n"
    "  --chunks N         N chunks of as nearly equal lengths as can be\n"
    "  --chunk-frames K   chunks of K frames (the last one shorter)\n"
    "  --gop G            frames from one keyframe to the next at most (default 250)\n"
    "  -o, --output, --frame, --frames, --codec, --crf, --preset, --bit-depth, --audio-from,\n"
    "  --no-audio         as for 'veltrane render' (see 'veltrane render --help')\n"
    "  --plugin PATH      the module, for the printed commands too\n"
    "  -h, --help         show this help\n"
    "\n"
    "Example:\n"
    "  veltrane plan scene.json --chunks 8 -o job.mp4 --crf 18 | xargs -P 2 -I{} sh -c {}\n"
    "  veltrane assemble job.mp4.plan.json\n";

// Options that belong to one run, not to the job: the chunks' renders take their own.
const char* const kRunOptions[] = {"-o", "--output", "--plugin", "--quiet", "--profile"};

// A word as a POSIX shell reads it back.
std::string shellWord(const std::string& word) {
  if (!word.empty() && word.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ"
                                              "0123456789_-+=./:,@%") == std::string::npos)
    return word;
  std::string quoted = "'";
  for (char c : word) quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return quoted + "'";
}

std::vector<FrameRange> chunkRanges(const std::map<std::string, std::string>& options,
                                    const FrameRange& frames) {
  const bool byCount = options.count("--chunks"), byLength = options.count("--chunk-frames");
  if (byCount == byLength) throw UsageError("give --chunks N or --chunk-frames K");
  if (byCount) return chunksOf(frames, parseInt32("--chunks", options.at("--chunks")));
  return chunksOfLength(frames, parseInt32("--chunk-frames", options.at("--chunk-frames")));
}

// Where the sound of the whole job comes from, for people reading the plan.
std::string soundText(const SoundChoice& sound) {
  if (sound.clips.empty()) return "none";
  std::string text;
  for (const refhost::AudioClip& clip : sound.clips) {
    char span[96];
    std::snprintf(span, sizeof span, " from %.3f s for %.3f s", clip.startSeconds, clip.seconds);
    text += (text.empty() ? "" : ", mixed with ") + clip.path + span;
  }
  return text;
}

// The encoding with the codec's default quality and speed written out, so that every chunk is
// encoded alike whatever its machine's veltrane takes as a default.
refhost::VideoEncoding settled(refhost::VideoEncoding encoding) {
  const refhost::VideoCodecInfo& info = *refhost::findVideoCodec(encoding.codec);
  if (info.defaultCrf && !encoding.crf) encoding.crf = info.defaultCrf;
  if (!info.presets.empty() && !encoding.preset) encoding.preset = info.defaultPreset;
  return encoding;
}

}  // namespace

int runPlan(const std::vector<std::string>& arguments) {
  if (wantsHelp(arguments)) {
    std::fputs(kPlanHelp, stdout);
    return 0;
  }
  std::vector<std::string> args = arguments;
  const AudioFrom audioFrom = takeAudioFrom(args);
  std::vector<OptionDefinition> definitions = kRenderOutputOptions;
  definitions.insert(definitions.end(),
                     {{"--chunks", true}, {"--chunk-frames", true}, {"--gop", true}});
  Arguments parsed = parseArguments(args, definitions);
  if (parsed.positional.size() != 1) throw UsageError("expects one scene file");
  std::map<std::string, std::string>& options = parsed.options;
  if (options.count("--call-log"))
    throw UsageError("option '--call-log' belongs to one chunk's render, not to the plan");
  outputName(options);
  const Scene scene = loadScene(parsed.positional.front());
  const RenderJob job = chooseRenderJob(scene, options, audioFrom);
  if (job.target.kind != refhost::OutputKind::Video)
    throw UsageError(
        "-o: a plan joins its chunks into a video (.mp4, .mov, .mkv or .webm); "
        "stills and sequences need no joining: render --frames A-B on each machine");

  FarmPlan plan;
  plan.file = job.target.path + ".plan.json";
  plan.scene = scene.file;
  plan.sceneChecksum = fileChecksum(scene.file);
  plan.output = job.target.path;
  plan.encoding = settled(job.target.video);
  plan.gopLength = options.count("--gop") ? parseInt32("--gop", options.at("--gop")) : kDefaultGop;
  if (plan.gopLength < 1) throw UsageError("option '--gop': expected 1 or more frames");
  plan.frames = job.frames;
  const std::vector<FrameRange> ranges = chunkRanges(options, job.frames);
  for (std::size_t i = 0; i < ranges.size(); ++i)
    plan.chunks.push_back(
        {ranges[i], chunkFileName(plan.output, plan.encoding.codec, i, ranges.size())});
  plan.renderOptions = options;
  for (const char* option : kRunOptions) plan.renderOptions.erase(option);
  for (const char* option : {"--chunks", "--chunk-frames", "--gop"})
    plan.renderOptions.erase(option);
  plan.audioFrom = audioFrom;
  plan.sound = soundText(job.sound);

  MadeFolder folder(std::filesystem::path(plan.file).parent_path().string(), "-o");
  writePlan(plan);
  folder.keep();
  std::string program = refhost::executablePath();
  program = shellWord(program.empty() ? "veltrane" : program);
  const std::string plugin =
      options.count("--plugin") ? " --plugin " + shellWord(options.at("--plugin")) : "";
  for (std::size_t i = 0; i < plan.chunks.size(); ++i)
    std::printf("%s render --plan %s --chunk %zu --quiet%s\n", program.c_str(),
                shellWord(plan.file).c_str(), i, plugin.c_str());
  std::fprintf(stderr,
               "veltrane plan: wrote %s (%s); when every chunk is rendered: %s assemble %s\n",
               plan.file.c_str(), plan.settingsText().c_str(), program.c_str(),
               shellWord(plan.file).c_str());
  return 0;
}

}  // namespace veltrane_cli
