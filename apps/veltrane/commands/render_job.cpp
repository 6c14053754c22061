// The output options, their checks and the run of a scene into its output.
#include "commands/render_job.h"

#ifdef __linux__
#include <malloc.h>
#endif

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <optional>
#include <stdexcept>
#include <thread>

#include "cli/stop_signals.h"
#include "output/call_log.h"
#include "output/made_folder.h"
#include "output/progress_bar.h"
#include "refhost/engine/render_loop.h"
#include "refhost/media/media_source.h"
#include "refhost/pipeline/async_frame_sink.h"
#include "refhost/pipeline/frame_output.h"
#include "scene/scene_engine.h"

namespace veltrane_cli {
namespace {

// Rendered frames waiting for the writer: enough to ride over a slow frame, few enough to keep
// memory low (a 1080p frame is 8 MB).
constexpr std::size_t kQueuedFrames = 4;
// ... and at most this many bytes of them: four 1080p frames, one 4K frame of half floats.
constexpr std::size_t kQueuedBytes = std::size_t{96} << 20;

// Frames are blocks of megabytes that one thread allocates and another frees, many times a
// second; glibc hands blocks that large back to the kernel and faults them in anew each time.
// Kept in the heap instead, they are reused.
void keepFrameMemory() {
#ifdef __linux__
  mallopt(M_MMAP_THRESHOLD, 32 << 20);
  mallopt(M_TRIM_THRESHOLD, 512 << 20);
#endif
}

// Image sequences are written by a worker per core, up to four.
int imageWriters() {
  return static_cast<int>(std::clamp(std::thread::hardware_concurrency(), 1u, 4u));
}

FrameRange parseRange(const std::string& text) {
  std::string::size_type dash = text.find('-', 1);
  if (dash == std::string::npos) {  // one frame, as --frame N
    const int32_t frame = parseInt32("--frames", text);
    return {frame, frame};
  }
  FrameRange range{parseInt32("--frames", text.substr(0, dash)),
                   parseInt32("--frames", text.substr(dash + 1))};
  if (range.last < range.first)
    throw UsageError("option '--frames' expects A <= B, got '" + text + "'");
  return range;
}

FrameRange chooseFrames(const std::map<std::string, std::string>& options,
                        const refhost::OutputTarget& target, const Scene& scene) {
  if (options.count("--frame") && options.count("--frames"))
    throw UsageError("give --frame or --frames, not both");
  int32_t duration = scene.composition.duration;
  FrameRange range{0, target.kind == refhost::OutputKind::Still ? 0 : duration - 1};
  if (options.count("--frame")) {
    int32_t frame = parseInt32("--frame", options.at("--frame"));
    range = {frame, frame};
  } else if (options.count("--frames")) {
    range = parseRange(options.at("--frames"));
  }
  if (target.kind == refhost::OutputKind::Still && range.count() != 1)
    throw UsageError("a ." +
                     std::string(target.imageFormat == refhost::ImageFormat::Png ? "png" : "exr") +
                     " output holds one frame; use a %04d pattern or a video for " +
                     std::to_string(range.count()) + " frames");
  if (range.first < 0 || range.last >= duration)
    throw UsageError("frames " + std::to_string(range.first) + "-" + std::to_string(range.last) +
                     " lie outside the scene's frames 0-" + std::to_string(duration - 1));
  return range;
}

const char* optionOf(refhost::EncodingSetting setting) {
  switch (setting) {
    case refhost::EncodingSetting::Codec:
      return "--codec";
    case refhost::EncodingSetting::Crf:
      return "--crf";
    case refhost::EncodingSetting::Preset:
      return "--preset";
    case refhost::EncodingSetting::BitDepth:
      return "--bit-depth";
  }
  return "--codec";
}

std::string imageKind(const refhost::OutputTarget& target) {
  const bool png = target.imageFormat == refhost::ImageFormat::Png;
  return std::string(png ? "a .png " : "an .exr ") +
         (target.kind == refhost::OutputKind::Sequence ? "sequence" : "output");
}

// The PNG depth of a still or sequence, refusing the video settings.
void chooseImageDepth(const std::map<std::string, std::string>& options,
                      refhost::OutputTarget& target) {
  for (const char* option : {"--codec", "--crf", "--preset"}) {
    if (options.count(option))
      throw UsageError(std::string("option '") + option + "': " + imageKind(target) +
                       " holds pictures, not video; it applies to .mp4, .mov, .mkv and .webm "
                       "outputs");
  }
  if (!options.count("--bit-depth")) return;
  const std::string& text = options.at("--bit-depth");
  const int32_t depth = parseInt32("--bit-depth", text);
  if (target.imageFormat == refhost::ImageFormat::Exr)
    throw UsageError("option '--bit-depth': " + imageKind(target) +
                     " is always half float; the option applies to .png (8 or 16) and video "
                     "(8 or 10) outputs");
  if (depth != 8 && depth != 16)
    throw UsageError("option '--bit-depth': expected 8 or 16 for " + imageKind(target) + ", got '" +
                     text + "'");
  target.imageBitDepth = depth;
}

// A video's encoding: the codec asked for or the container's, its defaults overridden by the
// options. Refuses what the codec or the container cannot do.
void chooseVideoEncoding(const std::map<std::string, std::string>& options,
                         refhost::OutputTarget& target) {
  refhost::VideoEncoding encoding = refhost::encodingFor(
      options.count("--codec") ? options.at("--codec") : refhost::defaultCodec(target.container));
  if (options.count("--bit-depth")) {
    const std::string& text = options.at("--bit-depth");
    encoding.bitDepth = parseInt32("--bit-depth", text);
    if (encoding.bitDepth != 8 && encoding.bitDepth != 10)
      throw UsageError("option '--bit-depth': expected 8 or 10 for a video output, got '" + text +
                       "'" + (encoding.bitDepth == 16 ? " (16 is for .png outputs)" : ""));
  }
  if (options.count("--crf")) encoding.crf = parseInt32("--crf", options.at("--crf"));
  if (options.count("--preset")) encoding.preset = options.at("--preset");
  if (auto refusal = refhost::refusalOf(encoding, target.container))
    throw UsageError(std::string("option '") + optionOf(refusal->setting) +
                     "': " + refusal->reason);
  target.video = encoding;
}

// Bits a channel the output keeps: a video's depth, a PNG's, and an EXR's half floats.
int32_t outputBitDepth(const refhost::OutputTarget& target) {
  if (target.kind == refhost::OutputKind::Video) return target.video.bitDepth;
  return target.imageFormat == refhost::ImageFormat::Exr ? 16 : target.imageBitDepth;
}

// What was damaged in a clip ("frame 89 is damaged (slices that did not decode)"), or empty
// when nothing was.
std::string damageText(const refhost::MediaSpec& media) {
  if (!media.damage || media.damage->count() == 0) return "";
  const int32_t count = media.damage->count();
  const std::string reason = " (" + media.damage->reason() + ")";
  if (media.info && !media.info->video) return "its picture decodes only in part" + reason;
  const std::string first = "frame " + std::to_string(media.damage->first());
  if (count == 1) return first + " is damaged" + reason;
  return std::to_string(count) + " frames are damaged, the first " + first + reason;
}

// Each clip with damage, as "clip 1 (a.mp4): frame 89 is damaged (...)", joined by "; ".
std::string damagedClips(const Scene& scene) {
  const std::vector<const refhost::MediaSpec*> media = sceneMedia(scene);
  const std::vector<std::string> names = clipNames(scene);
  std::string clips;
  for (std::size_t i = 0; i < media.size(); ++i)
    if (const std::string damage = damageText(*media[i]); !damage.empty())
      clips += (clips.empty() ? "" : "; ") + names[i] + ": " + damage;
  return clips;
}

// With --strict, a damaged frame fails the job in one line.
void refuseDamage(const Scene& scene) {
  if (const std::string clips = damagedClips(scene); !clips.empty())
    throw std::runtime_error(clips + "; --strict refuses damaged frames");
}

}  // namespace

const std::vector<OptionDefinition> kRenderOutputOptions = {
    {"-o", true},          {"--output", true}, {"--frame", true},   {"--frames", true},
    {"--codec", true},     {"--crf", true},    {"--preset", true},  {"--bit-depth", true},
    {"--no-audio", false}, {"--quiet", false}, {"--profile", true}, {"--plugin", true},
    {"--call-log", true},  {"--audio", true},  {"--strict", false}};

const char kRenderOutputHelp[] =
    "OUT by its name:\n"
    "  NAME.png, NAME.exr        one frame (frame 0 unless --frame N)\n"
    "  NAME_%04d.png (or .exr)   an image sequence, one file per frame\n"
    "  NAME.mp4, .mkv            H.264 video at the scene's rate (unless --codec says otherwise)\n"
    "  NAME.mov                  ProRes 422 HQ, 10-bit\n"
    "  NAME.webm                 VP9\n"
    "A video is converted to and tagged with the scene's colour space (its video source's, else\n"
    "BT.709). It carries the sound of the frames rendered: the first clip's by default (copied,\n"
    "or encoded as AAC, or Opus in .webm, where the container needs it), as long as the video,\n"
    "silent where a clip's sound ends; a note says why a video is silent. Clips are numbered\n"
    "from 1: the effect's own source, then the scene's layers in order (for split, the clips\n"
    "in the order given). A missing folder for OUT is made.\n"
    "A damaged frame of a clip is shown as the decoder conceals it (or the last good frame is\n"
    "held), and a warning at the end names the clips that had any.\n"
    "Files appear under their names only when complete, a sequence's all at once; on any\n"
    "failure, or when stopped by SIGINT, SIGTERM or SIGHUP (exit status 128 + the signal's\n"
    "number), nothing new is left and a file that had the name keeps its contents.\n"
    "\n"
    "Output options:\n"
    "  -o, --output OUT   where the frames go (required)\n"
    "  --frame N          render only frame N\n"
    "  --frames A-B       render frames A to B, or --frames N for frame N alone (default: every\n"
    "                     frame)\n"
    "  --codec C          a video's codec: h264 or h265 (.mp4, .mov, .mkv), prores (.mov,\n"
    "                     .mkv), ffv1 (.mkv; lossless, 4:4:4), vp9 or av1 (.webm, .mp4, .mkv)\n"
    "  --crf N            quality, lower is better: h264 and h265 0-51 (default 18 and 20),\n"
    "                     vp9 0-63 (default 31), av1 1-63 (default 30); prores and ffv1 have\n"
    "                     none\n"
    "  --preset P         h264 and h265 speed: ultrafast, superfast, veryfast, faster, fast\n"
    "                     (default), medium, slow, slower, veryslow, placebo\n"
    "  --bit-depth B      bits a channel: 8 or 10 for a video (10 with h265, prores, ffv1, vp9\n"
    "                     and av1; default 8, prores 10), 8 or 16 for a .png output (default 8);\n"
    "                     .exr is always half float. Above 8, frames are rendered in half floats\n"
    "  --audio-from N     a video's sound from clip N (e.g. --audio-from 2)\n"
    "  --audio-from FILE  a video's sound from FILE (e.g. --audio-from take2.wav)\n"
    "  --audio-from layer NAME\n"
    "                     a video's sound from the source file of the scene's layer NAME\n"
    "  --audio mix        the sound of every clip that has some, mixed (each at 1/N of its\n"
    "                     level, N the clips sounding, so the sum cannot clip)\n"
    "  --audio N,M,...    the sound of the clips listed, mixed (e.g. --audio 1,3)\n"
    "  --no-audio         leave the sound out of a video\n"
    "  --strict           fail on the first damaged frame of a clip instead of concealing it\n"
    "  --quiet            print no progress (into a log it is a line every few seconds)\n"
    "  --profile P        the profile of the host's OpenGL context: core (default) or compat\n"
    "                     (compatibility; not a video setting)\n"
    "  --plugin PATH      the module to load (default: $VELTRANE_PLUGIN when set, else\n"
    "                     <dir of veltrane>/../lib/veltrane.so)\n"
    "  --call-log FILE    write every message and the host operations the plug-in called\n"
    "                     during it to FILE (for looking into the plug-in; slower)\n";

std::string outputName(const std::map<std::string, std::string>& options) {
  if (options.count("-o") && options.count("--output")) throw UsageError("give -o only once");
  if (!options.count("-o") && !options.count("--output")) throw UsageError("needs -o OUT");
  return options.count("-o") ? options.at("-o") : options.at("--output");
}

RenderJob chooseRenderJob(const Scene& scene, const std::map<std::string, std::string>& options,
                          const AudioFrom& audioFrom) {
  RenderJob job;
  refhost::OutputTarget& target = job.target;
  try {
    target = refhost::parseOutputTarget(outputName(options));
  } catch (const std::invalid_argument& error) {
    throw UsageError(error.what());
  }
  if (target.kind == refhost::OutputKind::Video) {
    chooseVideoEncoding(options, target);
  } else {
    chooseImageDepth(options, target);
  }
  glProfile(options);  // checked with the other options, before anything is read
  job.frames = chooseFrames(options, target, scene);
  // The colour a video is converted to and tagged with is the composition's: the scene's own
  // choice, else its video source's, else BT.709 (see refhost::defaultColour).
  target.video.colour = scene.composition.colour;
  const refhost::FrameRate rate = scene.composition.frameRate;
  job.sound = chooseSound(
      audioFrom, options, scene, target.kind == refhost::OutputKind::Video ? "" : imageKind(target),
      static_cast<double>(job.frames.first) * rate.denominator / rate.numerator,
      static_cast<double>(job.frames.count()) * rate.denominator / rate.numerator);
  job.strict = options.count("--strict") > 0;
  return job;
}

int renderScene(const Scene& scene, const std::map<std::string, std::string>& options,
                const AudioFrom& audioFrom, const std::string& command) {
  return runRenderJob(scene, chooseRenderJob(scene, options, audioFrom), options, command);
}

int runRenderJob(const Scene& scene, const RenderJob& job,
                 const std::map<std::string, std::string>& options, const std::string& command) {
  const refhost::OutputTarget& target = job.target;
  const FrameRange& frames = job.frames;
  refhost::GlProfile profile = glProfile(options);
  std::string module = pluginPath(options);

  noteStopSignals();
  keepFrameMemory();
  const refhost::Composition& composition = scene.composition;
  const SoundChoice& sound = job.sound;
  const bool strict = job.strict;
  if (strict) refuseDamage(scene);  // stills are read with the scene
  // A missing folder for the output is made (and taken away again if the render fails).
  std::string folder = std::filesystem::path(target.path).parent_path().string();
  MadeFolder madeFolder(folder, "-o");
  // The output is opened first so that a name that cannot be written fails before any render.
  // Until commit() it exists only under a temporary name, deleted if anything below throws.
  refhost::AsyncFrameSink sink(refhost::openFrameSink(target, composition.width, composition.height,
                                                      composition.frameRate, sound.clips),
                               imageWriters(), kQueuedFrames, kQueuedBytes);
  SceneEngineOptions engineOptions;
  engineOptions.modulePath = module;
  engineOptions.profile = profile;
  // The frames' pixel format: half floats when the output keeps more than 8 bits (or, decided
  // by the composition, when an input holds more), else 8 bits.
  engineOptions.outputBitDepth = outputBitDepth(target);
  std::optional<CallLogFile> callLog;
  if (options.count("--call-log")) {
    callLog.emplace(options.at("--call-log"));
    engineOptions.onMessage = callLog->recorder();
  }
  std::unique_ptr<refhost::Engine> engine = startScene(scene, std::move(engineOptions));
  {
    ProgressBar progress(
        "rendering", frames.count(), stderr,
        options.count("--quiet") ? ProgressBar::Style::Quiet : ProgressBar::Style::Auto);
    refhost::RenderRun run = refhost::framesFromTo(frames.first, frames.last);
    run.beforeFrame = [&] {
      throwIfStopped();
      if (strict) refuseDamage(scene);
    };
    run.written = [&](int32_t done) { progress.update(done); };
    refhost::renderFrames(*engine, run, sink);
  }
  engine->finish();
  throwIfStopped();
  if (strict) refuseDamage(scene);
  std::string note = sink.note();
  std::vector<std::string> written = sink.commit();
  madeFolder.keep();
  if (!note.empty()) std::fprintf(stderr, "veltrane %s: note: %s\n", command.c_str(), note.c_str());
  if (!sound.silence.empty())
    std::fprintf(stderr, "veltrane %s: note: %s has no sound: %s\n", command.c_str(),
                 target.path.c_str(), sound.silence.c_str());
  if (const std::string clips = damagedClips(scene); !clips.empty())
    std::fprintf(stderr,
                 "veltrane %s: warning: damaged frames were shown as the decoder concealed them: "
                 "%s; --strict refuses them\n",
                 command.c_str(), clips.c_str());
  std::string where =
      written.size() == 1 ? written.front() : written.front() + " ... " + written.back();
  std::printf("wrote %s (%d frame%s of %dx%d)\n", where.c_str(), frames.count(),
              frames.count() == 1 ? "" : "s", composition.width, composition.height);
  return 0;
}

}  // namespace veltrane_cli
