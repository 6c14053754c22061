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

#include "cli/nearest_name.h"
#include "cli/output_safety.h"
#include "cli/stop_signals.h"
#include "commands/frame_choice.h"
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

// "; did you mean ..." for a codec or preset name that is none of the known ones.
std::string nearestEncodingName(const refhost::VideoEncoding& encoding) {
  const refhost::VideoCodecInfo* codec = refhost::findVideoCodec(encoding.codec);
  if (!codec) {
    std::vector<std::string> names;
    for (const refhost::VideoCodecInfo& known : refhost::videoCodecs()) names.push_back(known.name);
    return didYouMean(encoding.codec, names);
  }
  const auto& presets = codec->presets;
  if (encoding.preset &&
      std::find(presets.begin(), presets.end(), *encoding.preset) == presets.end())
    return didYouMean(*encoding.preset, presets);
  return "";
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
                     "': " + refusal->reason + nearestEncodingName(encoding));
  target.video = encoding;
}

// Bits a channel the output keeps: a video's depth, a PNG's, and an EXR's half floats.
int32_t outputBitDepth(const refhost::OutputTarget& target) {
  if (target.kind == refhost::OutputKind::Video) return target.video.bitDepth;
  return target.imageFormat == refhost::ImageFormat::Exr ? 16 : target.imageBitDepth;
}

// The file whose sound a video carries for --audio-from; refused when there is none to take.
std::string audioFile(const AudioFrom& from, const Scene& scene) {
  if (from.kind == AudioFrom::Kind::File) {
    std::error_code error;
    const auto status = std::filesystem::status(from.name, error);
    if (!std::filesystem::exists(status))
      throw UsageError("option '--audio-from': expected a file with sound, '" + from.name +
                       "' does not exist");
    if (std::filesystem::is_directory(status))
      throw UsageError("option '--audio-from': expected a file with sound, '" + from.name +
                       "' is a directory");
    return from.name;
  }
  const refhost::Composition& composition = scene.composition;
  const refhost::MediaSpec* media =
      composition.ownLayerName == from.name ? &composition.source : nullptr;
  std::string names = "'" + composition.ownLayerName + "'";
  for (const refhost::CompositionLayer& layer : composition.layers) {
    if (!media && layer.layer.name == from.name) media = &layer.media;
    names += ", '" + layer.layer.name + "'";
  }
  if (!media)
    throw UsageError(
        "option '--audio-from': expected 'layer' and the name of one of the scene's "
        "layers (" +
        names + "), got '" + from.name + "'");
  if (media->kind != refhost::MediaSpec::Kind::File || !refhost::isVideoPath(media->path))
    throw UsageError("option '--audio-from': layer '" + from.name +
                     "' shows no video file, so it has no sound");
  return media->path;
}

// The sound a video carries, over the time of the frames rendered: the effect's own source's
// when that is a video, another file's or a layer's with --audio-from, none with --no-audio.
refhost::AudioClip chooseAudio(const AudioFrom& from,
                               const std::map<std::string, std::string>& options,
                               const Scene& scene, const refhost::OutputTarget& target,
                               const FrameRange& frames) {
  const bool video = target.kind == refhost::OutputKind::Video;
  if (from.kind != AudioFrom::Kind::None) {
    if (options.count("--no-audio")) throw UsageError("give --audio-from or --no-audio, not both");
    if (!video)
      throw UsageError("option '--audio-from': " + imageKind(target) +
                       " has no sound; it applies to .mp4, .mov, .mkv and .webm outputs");
  }
  if (!video || options.count("--no-audio")) return {};
  const refhost::Composition& composition = scene.composition;
  refhost::AudioClip clip;
  if (from.kind != AudioFrom::Kind::None) {
    clip.path = audioFile(from, scene);
    clip.required = true;
  } else if (composition.source.kind == refhost::MediaSpec::Kind::File &&
             refhost::isVideoPath(composition.source.path)) {
    clip.path = composition.source.path;
  } else {
    return {};
  }
  clip.startSeconds = frames.first / composition.frameRate;
  // The own source's sound starts where its pictures do in a trimmed file.
  if (clip.path == composition.source.path) clip.startSeconds += composition.source.startSeconds;
  clip.seconds = frames.count() / composition.frameRate;
  return clip;
}

}  // namespace

const std::vector<OptionDefinition> kRenderOutputOptions = {
    {"-o", true},           {"--output", true},    {"--frame", true},        {"--frames", true},
    {"--from", true},       {"--to", true},        {"--codec", true},        {"--crf", true},
    {"--preset", true},     {"--bit-depth", true}, {"--no-audio", false},    {"--quiet", false},
    {"--profile", true},    {"--plugin", true},    {"--call-log", true},     {"-y", false},
    {"--overwrite", false}, {"-n", false},         {"--no-overwrite", false}};

const char kRenderOutputHelp[] =
    "OUT by its name:\n"
    "  NAME.png, NAME.exr        one frame (frame 0 unless --frame N)\n"
    "  NAME_%04d.png (or .exr)   an image sequence, one file per frame\n"
    "  NAME.mp4, .mkv            H.264 video at the scene's rate (unless --codec says otherwise)\n"
    "  NAME.mov                  ProRes 422 HQ, 10-bit\n"
    "  NAME.webm                 VP9\n"
    "A video is converted to and tagged with the scene's colour space (its video source's, else\n"
    "BT.709). When the effect's own source is a video with sound, a video output carries the\n"
    "sound of the frames rendered (copied, or encoded as AAC, or Opus in .webm, where the\n"
    "container needs it). A missing folder for OUT is made. OUT may not be an input (the\n"
    "scene, its media, a clip): that is refused before anything is read. A file already\n"
    "under OUT's name is replaced with -y, kept with -n; without either a terminal asks, and\n"
    "without a terminal the render is refused.\n"
    "Files appear under their names only when complete, a sequence's all at once; on any\n"
    "failure, or when stopped by SIGINT, SIGTERM or SIGHUP (exit status 128 + the signal's\n"
    "number), nothing new is left and a file that had the name keeps its contents.\n"
    "\n"
    "Output options:\n"
    "  -o, --output OUT   where the frames go (required)\n"
    "  --frame N          render only frame N (or the frame shown at a time, e.g. 1.5)\n"
    "  --frames A-B       render frames A to B, or --frames N for frame N alone (default: every\n"
    "                     frame); A and B may be times (1.0-2.0: the frames from 1 s until 2 s)\n"
    "  --from T, --to T   render from time T, until time T (as FFmpeg's -ss and -to): seconds\n"
    "                     (2.5, 500ms) or [HH:]MM:SS[.mmm] (00:01:02.500)\n"
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
    "  --audio-from FILE  a video's sound from FILE instead of the effect's own source\n"
    "  --audio-from layer NAME\n"
    "                     a video's sound from the source file of the scene's layer NAME\n"
    "  --no-audio         leave the sound out of a video\n"
    "  -y, --overwrite    replace an output that is there already\n"
    "  -n, --no-overwrite keep it: refuse to render when one is there\n"
    "  --quiet            print no progress (into a log it is a line every few seconds)\n"
    "  --profile P        the profile of the host's OpenGL context: core (default) or compat\n"
    "                     (compatibility; not a video setting)\n"
    "  --plugin PATH      the module to load (default: $VELTRANE_PLUGIN when set, else\n"
    "                     <dir of veltrane>/../lib/veltrane.so)\n"
    "  --call-log FILE    write every message and the host operations the plug-in called\n"
    "                     during it to FILE (for looking into the plug-in; slower)\n";

// Takes "--audio-from FILE" and "--audio-from layer NAME" out of the arguments before the
// others are parsed: the layer form is two words, so that a layer's name needs no quoting
// of its own. The last one given counts, as with every other option.
AudioFrom takeAudioFrom(std::vector<std::string>& args) {
  AudioFrom found;
  const std::string option = "--audio-from";
  for (std::size_t i = 0; i < args.size();) {
    std::string value;
    if (args[i] == option) {
      if (i + 1 >= args.size()) throw UsageError("option '--audio-from' needs a value");
      value = args[i + 1];
      args.erase(args.begin() + static_cast<long>(i), args.begin() + static_cast<long>(i) + 2);
    } else if (args[i].rfind(option + "=", 0) == 0) {
      value = args[i].substr(option.size() + 1);
      args.erase(args.begin() + static_cast<long>(i));
    } else {
      ++i;
      continue;
    }
    if (value != "layer") {
      found = {AudioFrom::Kind::File, value};
    } else if (i < args.size()) {
      found = {AudioFrom::Kind::Layer, args[i]};
      args.erase(args.begin() + static_cast<long>(i));
    } else {
      throw UsageError("option '--audio-from': expected a layer's name after 'layer'");
    }
  }
  return found;
}

std::string outputName(const std::map<std::string, std::string>& options) {
  if (options.count("-o") && options.count("--output")) throw UsageError("give -o only once");
  if (!options.count("-o") && !options.count("--output")) throw UsageError("needs -o OUT");
  return options.count("-o") ? options.at("-o") : options.at("--output");
}

int renderScene(const Scene& scene, const std::map<std::string, std::string>& options,
                const AudioFrom& audioFrom, const std::string& command,
                const std::vector<std::string>& notes) {
  refhost::OutputTarget target;
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
  refhost::GlProfile profile = glProfile(options);
  std::string module = pluginPath(options);

  noteStopSignals();
  keepFrameMemory();
  const refhost::Composition& composition = scene.composition;
  FrameRange frames = chooseFrames(options, target, composition.duration, composition.frameRate);
  checkOutputNames(options.count("-o") ? "-o" : "--output", target.path,
                   outputFileNames(target, frames), replacingChoice(options));
  for (const std::string& note : notes)
    std::fprintf(stderr, "veltrane %s: note: %s\n", command.c_str(), note.c_str());
  // The colour a video is converted to and tagged with is the composition's: the scene's own
  // choice, else its video source's, else BT.709 (see refhost::defaultColour).
  target.video.colour = composition.colour;
  const refhost::AudioClip audio = chooseAudio(audioFrom, options, scene, target, frames);
  // A missing folder for the output is made (and taken away again if the render fails).
  std::string folder = std::filesystem::path(target.path).parent_path().string();
  MadeFolder madeFolder(folder, "-o");
  // The output is opened first so that a name that cannot be written fails before any render.
  // Until commit() it exists only under a temporary name, deleted if anything below throws.
  refhost::AsyncFrameSink sink(refhost::openFrameSink(target, composition.width, composition.height,
                                                      composition.frameRate, audio),
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
    run.beforeFrame = throwIfStopped;
    run.written = [&](int32_t done) { progress.update(done); };
    refhost::renderFrames(*engine, run, sink);
  }
  engine->finish();
  throwIfStopped();
  std::string note = sink.note();
  std::vector<std::string> written = sink.commit();
  madeFolder.keep();
  if (!note.empty()) std::fprintf(stderr, "veltrane %s: note: %s\n", command.c_str(), note.c_str());
  std::string where =
      written.size() == 1 ? written.front() : written.front() + " ... " + written.back();
  std::printf("wrote %s (%d frame%s of %dx%d)\n", where.c_str(), frames.count(),
              frames.count() == 1 ? "" : "s", composition.width, composition.height);
  return 0;
}

}  // namespace veltrane_cli
