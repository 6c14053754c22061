// The layers an input can name in MLT: the track the effect sits on ("own"), the track below it
// ("lower"), or any track of the tractor ("track:K" by MLT's index, 0 at the bottom, or
// "track:NAME" by the name an editor shows for it), and the layer GUIDs the engine knows the
// tracks by.
#pragma once

#include <framework/mlt.h>

#include <functional>
#include <optional>
#include <string>
#include <string_view>

namespace veltrane_mlt {

// The GUID the engine knows the track the effect is applied to by (its own layer).
extern const char* const kOwnLayerGuid;

// The most tracks one composition shows: the effect has nine inputs.
constexpr int kMostTracks = 9;

struct LayerName {
  enum class Kind { Own, Lower, TrackIndex, TrackName };
  Kind kind = Kind::Own;
  int track = -1;         // TrackIndex
  std::string trackName;  // TrackName
};

// "own", "lower", "track:3" or "track:V2" (any case, spaces around ignored); nothing for any
// other text.
std::optional<LayerName> parseLayerName(std::string_view text);

// The tractor's track a name stands for where the effect is: -1 for its own track (and for a
// track that is not there, which the effect shows as its own source).
using LayerResolver = std::function<int(const LayerName&)>;

// The GUID the engine knows track `track` by; the null GUID for -1 (the own source).
std::string trackGuid(int track);
// The track a GUID made by trackGuid names; -1 for any other GUID.
int trackOfGuid(std::string_view guid);

// The index of the multitrack's track an editor names `name`: the track's own name as Kdenlive
// (kdenlive:track_name) or Shotcut (shotcut:name) keeps it, else Kdenlive's numbering of video
// tracks from the bottom ("V1", "V2"; its black track and audio tracks are not counted). -1 when
// no track has it.
int trackNamed(mlt_multitrack multitrack, std::string_view name);

// Resolves names among the tracks of `multitrack` (null: there are none, every track name is
// the own source), "lower" being `lowerTrack` (-1: the effect has no lower track).
LayerResolver tractorResolver(mlt_multitrack multitrack, int lowerTrack);

}  // namespace veltrane_mlt
