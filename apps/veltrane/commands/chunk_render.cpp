// `veltrane render --plan FILE --chunk I`: renders one chunk of a farm job as a piece to be
// joined: video only, encoded with the plan's settings, timed at its place in the job and
// tagged with the plan's scene, settings and the chunk's frames.
#include "commands/chunk_render.h"

#include <map>
#include <stdexcept>

#include "commands/farm_plan.h"
#include "scene/scene_document.h"

namespace veltrane_cli {
namespace {

// What a chunk's render takes besides the plan: how this run goes, never what it writes.
const std::vector<OptionDefinition> kChunkOptions = {{"--plan", true},   {"--chunk", true},
                                                     {"--quiet", false}, {"--profile", true},
                                                     {"--plugin", true}, {"--call-log", true}};

}  // namespace

const FarmPlan& checkedAgainstScene(const FarmPlan& plan) {
  if (fileChecksum(plan.scene) != plan.sceneChecksum)
    throw std::runtime_error(plan.scene + " has changed since " + plan.file +
                             " was made; make the plan again (veltrane plan)");
  return plan;
}

bool isChunkRender(const std::vector<std::string>& args) {
  for (const std::string& arg : args)
    if (arg == "--plan" || arg.rfind("--plan=", 0) == 0) return true;
  return false;
}

int renderChunk(const std::vector<std::string>& args) {
  std::map<std::string, std::string> options;
  try {
    options = parseOptions(args, kChunkOptions);
  } catch (const UsageError& error) {
    throw UsageError(std::string(error.what()) +
                     "; with --plan the output and its settings come from the plan");
  }
  if (!options.count("--chunk")) throw UsageError("option '--plan' needs --chunk I");
  const FarmPlan plan = readPlan(options.at("--plan"));
  const int32_t index = parseInt32("--chunk", options.at("--chunk"));
  if (index < 0 || static_cast<std::size_t>(index) >= plan.chunks.size())
    throw UsageError("option '--chunk': " + plan.file + " has chunks 0 to " +
                     std::to_string(plan.chunks.size() - 1) + ", got '" + options.at("--chunk") +
                     "'");
  const Scene scene = loadScene(checkedAgainstScene(plan).scene);
  const FarmChunk& chunk = plan.chunks[static_cast<std::size_t>(index)];

  RenderJob job;
  job.frames = chunk.frames;
  job.target = refhost::parseOutputTarget(chunk.file);
  job.target.video = plan.encoding;
  job.target.video.colour = scene.composition.colour;
  refhost::JoinablePiece piece;
  // Timed as the frames of a render of the whole job: from 0 at the job's first frame.
  piece.firstFrame = chunk.frames.first - plan.frames.first;
  piece.gopLength = plan.gopLength;
  piece.tags = {{kPlanSceneTag, plan.sceneChecksum},
                {kPlanSettingsTag, plan.settingsText()},
                {kPlanChunkTag, plan.chunkText(static_cast<std::size_t>(index))}};
  job.target.video.piece = piece;
  return runRenderJob(scene, job, options, "render");
}

}  // namespace veltrane_cli
