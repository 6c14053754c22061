// The codecs a video can be written with, their defaults and limits, and the checks of a choice
// against them. Only the question of which container holds which codec goes to FFmpeg.
#include "refhost/pipeline/video_encoding.h"

#include <algorithm>

namespace refhost {
namespace {

const std::vector<std::string> kX26xPresets = {"ultrafast", "superfast", "veryfast", "faster",
                                               "fast",      "medium",    "slow",     "slower",
                                               "veryslow",  "placebo"};

std::vector<VideoCodecInfo> makeCodecs() {
  std::vector<VideoCodecInfo> codecs;
  VideoCodecInfo h264;
  h264.name = "h264";
  h264.coding = "h264";
  h264.encoders = {{"libx264", 1, {}}};
  h264.chroma = "420";
  h264.bitDepths = {8};
  h264.defaultCrf = 18;
  h264.crfMax = 51;
  h264.presets = kX26xPresets;
  h264.defaultPreset = "fast";
  codecs.push_back(h264);

  VideoCodecInfo h265 = h264;
  h265.name = "h265";
  h265.coding = "hevc";
  // libx265 prints its settings to stderr itself, past FFmpeg's log level.
  h265.encoders = {{"libx265", 1, {{"x265-params", "log-level=error"}}}};
  h265.bitDepths = {8, 10};
  h265.defaultCrf = 20;
  codecs.push_back(h265);

  VideoCodecInfo prores;
  prores.name = "prores";
  prores.coding = "prores";
  prores.encoders = {{"prores_ks", 1, {{"profile", "hq"}}}};
  prores.chroma = "422";
  prores.bitDepths = {10};
  prores.defaultBitDepth = 10;
  prores.withoutCrf = "ProRes 422 HQ has a fixed quality";
  // ProRes streams have no range flag: every decoder reads them as limited range.
  prores.fullRange = false;
  codecs.push_back(prores);

  VideoCodecInfo ffv1;
  ffv1.name = "ffv1";
  ffv1.coding = "ffv1";
  // Version 3 codes slices on every core and checks each with a CRC. As the lossless
  // intermediate it keeps full chroma.
  ffv1.encoders = {{"ffv1", 1, {{"level", "3"}}}};
  ffv1.chroma = "444";
  ffv1.bitDepths = {8, 10};
  ffv1.withoutCrf = "ffv1 is lossless";
  codecs.push_back(ffv1);

  VideoCodecInfo vp9;
  vp9.name = "vp9";
  vp9.coding = "vp9";
  // A bit rate of 0 makes the CRF the only target; rows in parallel and the faster end of
  // "good" keep a render's encode close to its render time.
  vp9.encoders = {
      {"libvpx-vp9", 1, {{"b", "0"}, {"row-mt", "1"}, {"deadline", "good"}, {"cpu-used", "5"}}}};
  vp9.chroma = "420";
  vp9.bitDepths = {8, 10};
  vp9.defaultCrf = 31;
  vp9.crfMax = 63;
  codecs.push_back(vp9);

  VideoCodecInfo av1 = vp9;
  av1.name = "av1";
  av1.coding = "av1";
  // SVT-AV1 is many times faster than libaom at the same quality, but takes no frame under
  // 64 lines or columns. Its CRF of 0 would mean "unset", so the scale starts at 1.
  av1.encoders = {{"libsvtav1", 64, {{"preset", "8"}}},
                  {"libaom-av1", 1, {{"b", "0"}, {"row-mt", "1"}, {"cpu-used", "6"}}}};
  av1.defaultCrf = 30;
  av1.crfMin = 1;
  codecs.push_back(av1);
  return codecs;
}

// "a, b or c"
std::string listed(const std::vector<std::string>& names, const char* last = " or ") {
  std::string text;
  for (std::size_t i = 0; i < names.size(); ++i)
    text += (i == 0 ? "" : i + 1 == names.size() ? last : ", ") + names[i];
  return text;
}

std::string depthList(const std::vector<int32_t>& depths) {
  std::vector<std::string> names;
  for (int32_t depth : depths) names.push_back(std::to_string(depth));
  return listed(names);
}

std::optional<EncodingRefusal> bitDepthRefusal(const VideoCodecInfo& codec, int32_t asked) {
  const auto& depths = codec.bitDepths;
  if (std::find(depths.begin(), depths.end(), asked) != depths.end()) return std::nullopt;
  std::vector<std::string> others;
  for (const VideoCodecInfo& other : videoCodecs()) {
    if (std::count(other.bitDepths.begin(), other.bitDepths.end(), asked))
      others.push_back(other.name);
  }
  // A codec of one depth points to those that have the depth asked for.
  if (depths.size() == 1 && !others.empty())
    return EncodingRefusal{EncodingSetting::BitDepth, codec.name + " is " +
                                                          std::to_string(depths.front()) +
                                                          "-bit here; use " + listed(others) +
                                                          " for " + std::to_string(asked) + "-bit"};
  return EncodingRefusal{EncodingSetting::BitDepth, "expected " + depthList(depths) + " for " +
                                                        codec.name + ", got '" +
                                                        std::to_string(asked) + "'"};
}

}  // namespace

const std::vector<VideoCodecInfo>& videoCodecs() {
  static const std::vector<VideoCodecInfo> codecs = makeCodecs();
  return codecs;
}

const VideoCodecInfo* findVideoCodec(const std::string& name) {
  for (const VideoCodecInfo& codec : videoCodecs()) {
    if (codec.name == name) return &codec;
  }
  return nullptr;
}

const char* containerExtension(VideoContainer container) {
  switch (container) {
    case VideoContainer::Mp4:
      return "mp4";
    case VideoContainer::Mov:
      return "mov";
    case VideoContainer::Mkv:
      return "mkv";
    case VideoContainer::Webm:
      return "webm";
  }
  return "mp4";
}

std::string defaultCodec(VideoContainer container) {
  switch (container) {
    case VideoContainer::Mov:
      return "prores";
    case VideoContainer::Webm:
      return "vp9";
    case VideoContainer::Mp4:
    case VideoContainer::Mkv:
      break;
  }
  return "h264";
}

VideoEncoding encodingFor(const std::string& codec) {
  VideoEncoding encoding;
  encoding.codec = codec;
  const VideoCodecInfo* info = findVideoCodec(codec);
  if (info) encoding.bitDepth = info->defaultBitDepth;
  return encoding;
}

std::optional<EncodingRefusal> refusalOf(const VideoEncoding& encoding, VideoContainer container) {
  const VideoCodecInfo* codec = findVideoCodec(encoding.codec);
  if (!codec) {
    std::vector<std::string> names;
    for (const VideoCodecInfo& known : videoCodecs()) names.push_back(known.name);
    return EncodingRefusal{EncodingSetting::Codec, "expected one of " + listed(names, ", ") +
                                                       ", got '" + encoding.codec + "'"};
  }
  if (!containerHolds(container, codec->name)) {
    std::vector<std::string> holders;
    for (VideoContainer other :
         {VideoContainer::Mp4, VideoContainer::Mov, VideoContainer::Mkv, VideoContainer::Webm}) {
      if (containerHolds(other, codec->name))
        holders.push_back(std::string(".") + containerExtension(other));
    }
    return EncodingRefusal{
        EncodingSetting::Codec,
        "a ." + std::string(containerExtension(container)) + " file cannot hold " + codec->name +
            (holders.empty() ? "; no container here can" : "; use " + listed(holders))};
  }
  if (auto refusal = bitDepthRefusal(*codec, encoding.bitDepth)) return refusal;
  if (encoding.crf) {
    if (!codec->defaultCrf) {
      std::vector<std::string> scaled;
      for (const VideoCodecInfo& other : videoCodecs())
        if (other.defaultCrf) scaled.push_back(other.name);
      return EncodingRefusal{EncodingSetting::Crf, codec->name + " has no CRF quality (" +
                                                       codec->withoutCrf + "); " +
                                                       listed(scaled, " and ") + " have one"};
    }
    if (*encoding.crf < codec->crfMin || *encoding.crf > codec->crfMax)
      return EncodingRefusal{EncodingSetting::Crf,
                             "expected a whole number from " + std::to_string(codec->crfMin) +
                                 " to " + std::to_string(codec->crfMax) + " for " + codec->name +
                                 ", got '" + std::to_string(*encoding.crf) + "'"};
  }
  if (encoding.preset) {
    if (codec->presets.empty()) {
      std::vector<std::string> withPresets;
      for (const VideoCodecInfo& other : videoCodecs())
        if (!other.presets.empty()) withPresets.push_back(other.name);
      return EncodingRefusal{EncodingSetting::Preset, codec->name + " takes no preset; " +
                                                          listed(withPresets, " and ") + " do"};
    }
    if (std::find(codec->presets.begin(), codec->presets.end(), *encoding.preset) ==
        codec->presets.end())
      return EncodingRefusal{EncodingSetting::Preset,
                             "expected one of " + listed(codec->presets, ", ") + " for " +
                                 codec->name + ", got '" + *encoding.preset + "'"};
  }
  return std::nullopt;
}

std::string encodedPixelFormat(const VideoCodecInfo& codec, int32_t bitDepth) {
  return "yuv" + codec.chroma + "p" + (bitDepth > 8 ? std::to_string(bitDepth) + "le" : "");
}

}  // namespace refhost
