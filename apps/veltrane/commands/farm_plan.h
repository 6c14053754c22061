// A render job divided into chunks for a render farm: the plan that `veltrane plan` writes
// beside the final video and that every chunk's render and the assembly read. Paths in the
// file are relative to the plan's folder (unless given absolute), so that the nodes of a farm
// find them from wherever they run.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "commands/render_job.h"
#include "refhost/pipeline/video_encoding.h"

namespace veltrane_cli {

struct FarmChunk {
  FrameRange frames;
  std::string file;  // the chunk's video, as this process finds it
};

struct FarmPlan {
  std::string file;                 // the plan's own path, as given
  std::string scene;                // the scene file, as this process finds it
  std::string sceneChecksum;        // of the scene file's bytes (see fileChecksum)
  std::string output;               // the final video, as this process finds it
  refhost::VideoEncoding encoding;  // codec, quality, speed and depth; the colour is the scene's
  int32_t gopLength = 0;
  FrameRange frames;  // of the whole job
  // The render's output options the job was planned with (no -o): what the assembly settles the
  // sound with, as a render of the whole job would. A file for --audio-from is as this process
  // finds it.
  std::map<std::string, std::string> renderOptions;
  AudioFrom audioFrom;
  std::string sound;  // where the sound comes from, for people; "none"
  std::vector<FarmChunk> chunks;

  // The settings every chunk is encoded and tagged with; chunks of other settings do not join.
  std::string settingsText() const;
  // The text chunk `index` is tagged with: which chunk of the job it holds.
  std::string chunkText(std::size_t index) const;
};

// The job's frames in `count` chunks of as nearly equal lengths as can be (the longer first),
// or in chunks of `length` frames (the last one shorter). Throws UsageError when there are
// fewer frames than chunks.
std::vector<FrameRange> chunksOf(const FrameRange& frames, int32_t count);
std::vector<FrameRange> chunksOfLength(const FrameRange& frames, int32_t length);

// Chunk files beside the final video: "job.mp4" gives "job.chunk000.mov" and on, in QuickTime
// files (which keep every frame's decoding time) where they hold the codec, else in Matroska.
std::string chunkFileName(const std::string& output, const std::string& codec, std::size_t index,
                          std::size_t count);

// A checksum of the file's bytes (64-bit FNV-1a, as hexadecimal text): enough to tell that a
// scene was edited. Throws std::runtime_error naming the file when it cannot be read.
std::string fileChecksum(const std::string& path);

// Writes the plan to `plan.file` in one step. Throws std::runtime_error naming the file.
void writePlan(const FarmPlan& plan);

// Reads and checks a plan. Throws FieldError naming the file and the field.
FarmPlan readPlan(const std::string& path);

// What chunk tags and plans name a chunk's settings by.
extern const char kPlanSceneTag[];
extern const char kPlanSettingsTag[];
extern const char kPlanChunkTag[];

}  // namespace veltrane_cli
