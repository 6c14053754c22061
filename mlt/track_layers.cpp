// Naming the tractor's tracks as the effect's layers.
#include "track_layers.h"

#include <cctype>
#include <charconv>
#include <cstdio>

#include "property_values.h"
#include "refhost/engine.h"

namespace veltrane_mlt {

const char* const kOwnLayerGuid = "10e0e700-0000-4000-8000-000000000001";

namespace {

std::string lowered(std::string_view text) {
  std::string out(text);
  for (char& c : out) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return out;
}

// Track GUIDs share their first 34 characters; the last two are the index in hexadecimal.
constexpr char kTrackGuidStem[] = "10e0e700-0000-4000-8000-0000000001";
constexpr std::size_t kStemLength = sizeof kTrackGuidStem - 1;

bool isAudioTrack(mlt_producer track) {
  mlt_properties properties = MLT_PRODUCER_PROPERTIES(track);
  return mlt_properties_get_int(properties, "kdenlive:audio_track") != 0;
}

bool isKdenliveBlackTrack(mlt_producer track) {
  const char* id = mlt_properties_get(MLT_PRODUCER_PROPERTIES(track), "id");
  return id && std::string_view(id) == "black_track";
}

}  // namespace

std::optional<LayerName> parseLayerName(std::string_view text) {
  const std::string word = lowered(trimmed(text));
  LayerName name;
  if (word == "own") return name;
  if (word == "lower") {
    name.kind = LayerName::Kind::Lower;
    return name;
  }
  constexpr std::string_view prefix = "track:";
  if (word.compare(0, prefix.size(), prefix) != 0) return std::nullopt;
  const std::string_view rest =
      trimmed(std::string_view(text).substr(trimmed(text).data() - text.data() + prefix.size()));
  if (rest.empty()) return std::nullopt;
  int index = -1;
  auto [end, error] = std::from_chars(rest.data(), rest.data() + rest.size(), index);
  if (error == std::errc() && end == rest.data() + rest.size()) {
    if (index < 0 || index > 255) return std::nullopt;
    name.kind = LayerName::Kind::TrackIndex;
    name.track = index;
    return name;
  }
  name.kind = LayerName::Kind::TrackName;
  name.trackName = std::string(rest);
  return name;
}

std::string trackGuid(int track) {
  if (track < 0 || track > 255) return refhost::kNoLayer;
  char text[40];
  std::snprintf(text, sizeof text, "%s%02x", kTrackGuidStem, track);
  return text;
}

int trackOfGuid(std::string_view guid) {
  if (guid.size() != kStemLength + 2 || guid.substr(0, kStemLength) != kTrackGuidStem) return -1;
  int track = -1;
  auto [end, error] =
      std::from_chars(guid.data() + kStemLength, guid.data() + guid.size(), track, 16);
  return error == std::errc() && end == guid.data() + guid.size() ? track : -1;
}

int trackNamed(mlt_multitrack multitrack, std::string_view name) {
  if (!multitrack) return -1;
  const std::string wanted = lowered(name);
  const int count = mlt_multitrack_count(multitrack);
  int video = 0;
  int byNumber = -1;
  for (int i = 0; i < count; ++i) {
    mlt_producer track = mlt_multitrack_track(multitrack, i);
    if (!track) continue;
    mlt_properties properties = MLT_PRODUCER_PROPERTIES(track);
    for (const char* key : {"kdenlive:track_name", "shotcut:name"}) {
      const char* own = mlt_properties_get(properties, key);
      if (own && *own && lowered(own) == wanted) return i;
    }
    if (isAudioTrack(track) || isKdenliveBlackTrack(track)) continue;
    if (byNumber < 0 && wanted == "v" + std::to_string(++video)) byNumber = i;
  }
  return byNumber;
}

LayerResolver tractorResolver(mlt_multitrack multitrack, int lowerTrack) {
  return [multitrack, lowerTrack](const LayerName& name) {
    const int count = multitrack ? mlt_multitrack_count(multitrack) : 0;
    switch (name.kind) {
      case LayerName::Kind::Own:
        return -1;
      case LayerName::Kind::Lower:
        return lowerTrack;
      case LayerName::Kind::TrackIndex:
        return name.track < count ? name.track : -1;
      case LayerName::Kind::TrackName:
        return trackNamed(multitrack, name.trackName);
    }
    return -1;
  };
}

}  // namespace veltrane_mlt
