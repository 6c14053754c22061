// `veltrane assemble`: checks that every chunk of a farm job is there, whole, of the plan's scene
// and settings and in order, and joins them into the final video without encoding the pictures
// again, with the sound of the whole job added once.
#include <cstdio>
#include <filesystem>
#include <map>
#include <stdexcept>

#include "cli/cli_support.h"
#include "cli/stop_signals.h"
#include "commands/chunk_render.h"
#include "commands/commands.h"
#include "commands/farm_plan.h"
#include "output/made_folder.h"
#include "refhost/pipeline/video_joiner.h"
#include "refhost/platform/staged_file.h"
#include "scene/scene_document.h"

namespace veltrane_cli {
namespace {

const char kAssembleHelp[] =
    "Usage: veltrane assemble FINAL.plan.json [--quiet]\n"
    "\n"
    "Joins the chunks of a plan (see 'veltrane plan --help') into the final video. Every chunk\n"
    "must be there, whole, rendered from the plan's scene with the plan's settings, and hold\n"
    "its own frames; else one line names the first chunk that is missing or does not fit, with\n"
    "the command that renders it again, and nothing is written. The pictures are copied as the\n"
    "chunks hold them; the sound that a render of the whole job carries is added once. The\n"
    "final video appears under its name only when complete.\n"
    "\n"
    "  --quiet            print nothing but errors\n"
    "  -h, --help         show this help\n";

std::string rerun(const FarmPlan& plan, std::size_t index) {
  return "; render it again: veltrane render --plan " + plan.file + " --chunk " +
         std::to_string(index);
}

// The first chunk that is missing, or whose tags say it belongs to another scene, other
// settings or other frames, stops the assembly before anything is written.
void checkChunks(const FarmPlan& plan) {
  for (std::size_t i = 0; i < plan.chunks.size(); ++i) {
    const FarmChunk& chunk = plan.chunks[i];
    const std::string name = "chunk " + std::to_string(i) + " (" + chunk.file + ")";
    std::error_code error;
    if (!std::filesystem::is_regular_file(chunk.file, error))
      throw std::runtime_error(name + " is missing" + rerun(plan, i));
    refhost::PieceHeader header;
    try {
      header = refhost::readPieceHeader(chunk.file);
    } catch (const std::runtime_error& error) {
      throw std::runtime_error(name + " is damaged: " + error.what() + rerun(plan, i));
    }
    auto tag = [&](const char* key) {
      auto found = header.tags.find(key);
      return found == header.tags.end() ? std::string() : found->second;
    };
    if (tag(kPlanSceneTag) != plan.sceneChecksum)
      throw std::runtime_error(name + " was rendered from another version of the scene" +
                               rerun(plan, i));
    if (tag(kPlanSettingsTag) != plan.settingsText())
      throw std::runtime_error(name + " was rendered with other settings (" +
                               tag(kPlanSettingsTag) + ", the plan's: " + plan.settingsText() +
                               ")" + rerun(plan, i));
    if (tag(kPlanChunkTag) != plan.chunkText(i))
      throw std::runtime_error(
          name + " holds " +
          (tag(kPlanChunkTag).empty() ? "no chunk of a plan" : tag(kPlanChunkTag)) + ", not " +
          plan.chunkText(i) + rerun(plan, i));
  }
}

}  // namespace

int runAssemble(const std::vector<std::string>& arguments) {
  if (wantsHelp(arguments)) {
    std::fputs(kAssembleHelp, stdout);
    return 0;
  }
  Arguments parsed = parseArguments(arguments, {{"--quiet", false}});
  if (parsed.positional.size() != 1) throw UsageError("expects one plan file");
  const FarmPlan plan = readPlan(parsed.positional.front());
  checkChunks(plan);
  // The sound is settled as a render of the whole job settles it, from the same options.
  const Scene scene = loadScene(checkedAgainstScene(plan).scene);
  std::map<std::string, std::string> options = plan.renderOptions;
  options["-o"] = plan.output;
  const RenderJob job = chooseRenderJob(scene, options, plan.audioFrom);

  noteStopSignals();
  MadeFolder folder(std::filesystem::path(plan.output).parent_path().string(), "-o");
  refhost::StagedFile file(plan.output);
  refhost::JoinedVideo joined{file.temporaryPath(), plan.output, job.target.container,
                              scene.composition.frameRate, job.sound.clips};
  std::vector<refhost::PieceToJoin> pieces;
  for (const FarmChunk& chunk : plan.chunks)
    pieces.push_back({chunk.file, chunk.frames.first - plan.frames.first, chunk.frames.count()});
  try {
    refhost::joinPieces(pieces, joined);
  } catch (const refhost::PieceMismatch& mismatch) {
    throw std::runtime_error("chunk " + std::to_string(mismatch.piece()) +
                             " does not fit: " + mismatch.what() + rerun(plan, mismatch.piece()));
  }
  throwIfStopped();
  refhost::syncFile(file.temporaryPath(), plan.output);
  file.commit();
  folder.keep();
  if (!parsed.options.count("--quiet"))
    std::printf("wrote %s (%d frames of %dx%d from %zu chunks)\n", plan.output.c_str(),
                plan.frames.count(), scene.composition.width, scene.composition.height,
                plan.chunks.size());
  return 0;
}

}  // namespace veltrane_cli
