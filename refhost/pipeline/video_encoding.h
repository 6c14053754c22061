// How a video is encoded: the codec, its quality and speed, the bits a sample, and the colour
// the pictures are converted to and tagged with; and what each codec allows, so that a bad
// choice is refused before anything is rendered.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "refhost/media/colour.h"

namespace refhost {

enum class VideoContainer { Mp4, Mov, Mkv, Webm };

// A piece of a longer video, encoded apart (a chunk of a job on a render farm) so that the
// pieces join into the whole video by copying their packets (see video_joiner.h): its first
// frame is a keyframe, no frame refers to one before the keyframe of its GOP, and its
// timestamps run from its first frame's place in the whole video.
struct JoinablePiece {
  int64_t firstFrame = 0;  // the place of its first frame in the whole video
  int32_t gopLength = 0;   // frames from one keyframe to the next at most, the same in every piece
  // Written into the file's metadata, for the joiner to check that the pieces belong together.
  std::vector<std::pair<std::string, std::string>> tags;
};

struct VideoEncoding {
  std::string codec = "h264";          // a name of videoCodecs()
  std::optional<int32_t> crf;          // empty: the codec's default quality
  std::optional<std::string> preset;   // empty: the codec's default speed
  int32_t bitDepth = 8;                // bits a sample of the encoded pictures
  ColourDescription colour;            // the matrix and range converted to; all four are tagged
  std::optional<JoinablePiece> piece;  // empty: a whole video
};

// One FFmpeg encoder of a codec and the private options it always gets.
struct EncoderChoice {
  std::string name;
  // The smallest width and height it accepts; smaller frames go to the next choice.
  int32_t minimumSize = 1;
  std::vector<std::pair<std::string, std::string>> options;
};

struct VideoCodecInfo {
  std::string name;                     // as the command line takes it
  std::string coding;                   // FFmpeg's name of the coding ("hevc" for h265)
  std::vector<EncoderChoice> encoders;  // in order of preference
  std::string chroma;                   // "420", "422" or "444": the chroma sampling written
  std::vector<int32_t> bitDepths;       // those it is written with
  int32_t defaultBitDepth = 8;
  // The CRF quality scale; a codec without one (fixed-quality or lossless) has no default.
  std::optional<int32_t> defaultCrf;
  int32_t crfMin = 0, crfMax = 0;
  std::vector<std::string> presets;  // empty: the codec takes none
  std::string defaultPreset;
  std::string withoutCrf;  // why a codec without a CRF scale has none
  bool fullRange = true;   // whether it can code full-range YUV; else it is written limited
};

const std::vector<VideoCodecInfo>& videoCodecs();
const VideoCodecInfo* findVideoCodec(const std::string& name);

// "mp4", "mov", "mkv", "webm": the file name's ending.
const char* containerExtension(VideoContainer container);

// The codec a container gets when none is asked for: H.264 in .mp4 and .mkv, ProRes in .mov,
// VP9 in .webm.
std::string defaultCodec(VideoContainer container);

// The codec's own bit depth and BT.709 colour, quality and speed left to the codec's defaults.
VideoEncoding encodingFor(const std::string& codec);

// Whether the container can hold the codec, as FFmpeg's muxers answer and then behave when
// the file is written (video_writer.cpp).
bool containerHolds(VideoContainer container, const std::string& codec);

enum class EncodingSetting { Codec, Crf, Preset, BitDepth };
struct EncodingRefusal {
  EncodingSetting setting;
  std::string reason;  // what is allowed, and what was asked
};

// The first setting that cannot be encoded into the container, and why; empty when all can.
std::optional<EncodingRefusal> refusalOf(const VideoEncoding& encoding, VideoContainer container);

// The FFmpeg pixel format name the codec's pictures are encoded as at the depth
// ("yuv420p", "yuv422p10le", ...).
std::string encodedPixelFormat(const VideoCodecInfo& codec, int32_t bitDepth);

}  // namespace refhost
