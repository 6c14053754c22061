// The filter: one track's picture is the effect's own source, and its inputs show that picture
// or the same track at other frames (time-shifted copies). On a tractor (Shotcut's Output
// track) its inputs can also show the tractor's tracks, which the tractor hands along with its
// frame: a filter there splits clips of different tracks.
#include <cstdio>
#include <cstring>
#include <set>
#include <string>

#include "effect_service.h"
#include "mlt_services.h"
#include "refhost/media/rgba_image.h"
#include "track_frames.h"

namespace veltrane_mlt {
namespace {

const char* const kStateProperty = "_veltrane_state";
// The own clip's key in the service's kept pictures (tracks are keyed by their index).
constexpr int kOwnClip = -1;

EffectService& effectOf(mlt_filter filter) {
  return *static_cast<EffectService*>(
      mlt_properties_get_data(MLT_FILTER_PROPERTIES(filter), kStateProperty, nullptr));
}

// Filters of this thread that are fetching a frame of their own track: the fetched frame passes
// through the same filter, which must leave it alone instead of fetching again.
thread_local std::set<mlt_filter> fetching;

class Fetching {
 public:
  explicit Fetching(mlt_filter filter) : filter_(filter) { fetching.insert(filter); }
  ~Fetching() { fetching.erase(filter_); }
  Fetching(const Fetching&) = delete;
  Fetching& operator=(const Fetching&) = delete;

 private:
  mlt_filter filter_;
};

bool isProducer(mlt_service service) {
  switch (mlt_service_identify(service)) {
    case mlt_service_producer_type:
    case mlt_service_playlist_type:
    case mlt_service_tractor_type:
    case mlt_service_chain_type:
      return true;
    default:
      return false;
  }
}

mlt_service attachedTo(mlt_filter filter) {
  return static_cast<mlt_service>(
      mlt_properties_get_data(MLT_FILTER_PROPERTIES(filter), "service", nullptr));
}

// The tractor the filter is attached to, if it is. The tractor at the root of an MLT document
// calls itself a producer named after the document's reader; what makes it a tractor is the
// multitrack it holds.
mlt_tractor tractorOf(mlt_filter filter) {
  mlt_service service = attachedTo(filter);
  const bool tractor =
      service && (mlt_service_identify(service) == mlt_service_tractor_type ||
                  mlt_properties_get_data(MLT_SERVICE_PROPERTIES(service), "multitrack", nullptr));
  return tractor ? reinterpret_cast<mlt_tractor>(service) : nullptr;
}

// Where the frame lies in the producer the filter is attached to (or, for a filter placed on a
// tractor's track, in that track), noted while the frame is made: by the time its picture is
// asked for, the producer has moved on.
TrackTime trackTimeOf(mlt_filter filter, mlt_frame frame) {
  TrackTime time;
  mlt_properties properties = MLT_FILTER_PROPERTIES(filter);
  mlt_service service = attachedTo(filter);
  time.position = static_cast<int32_t>(mlt_filter_get_position(filter, frame));
  if (service && isProducer(service)) {
    time.producer = reinterpret_cast<mlt_producer>(service);
  } else {
    time.producer =
        multitrackTrack(MLT_FILTER_SERVICE(filter), mlt_properties_get_int(properties, "track"));
    time.position = static_cast<int32_t>(mlt_frame_get_position(frame));
  }
  if (!canSeek(time.producer) || !clipCanSeek(frame)) time.producer = nullptr;
  time.length = time.producer ? static_cast<int32_t>(mlt_producer_get_playtime(time.producer))
                              : time.position + 1;
  return time;
}

// The frame's notes of one filter: a frame may pass through several filters of this kind.
std::string noteName(mlt_filter filter, const char* what) {
  char prefix[48];
  std::snprintf(prefix, sizeof prefix, "_veltrane.%p.", static_cast<void*>(filter));
  return prefix + std::string(what);
}

// The tractor's frame of track `track`: it keeps the frame of every track on the frame it
// makes, in track order, under names made of its id and a number ("mlt_tractor 46_2"; MLT
// before 7 wrote "_46_2").
mlt_frame tractorTrackFrame(mlt_tractor tractor, mlt_frame frame, int track) {
  const char* id = mlt_properties_get(MLT_TRACTOR_PROPERTIES(tractor), "_unique_id");
  if (!id) return nullptr;
  const std::string prefix = "mlt_tractor " + std::string(id) + "_";
  mlt_properties properties = MLT_FRAME_PROPERTIES(frame);
  int seen = 0;
  for (int i = 0; i < mlt_properties_count(properties); ++i) {
    const char* name = mlt_properties_get_name(properties, i);
    if (!name || std::strncmp(name, prefix.c_str(), prefix.size()) != 0) continue;
    if (seen++ == track)
      return static_cast<mlt_frame>(mlt_properties_get_data_at(properties, i, nullptr));
  }
  return nullptr;
}

// Copies of the pictures of the tracks the inputs name, at width x height, taken from the
// frames the tractor keeps. They are taken before the tractor's own picture: making it blends
// the tracks into their frames' pictures.
std::map<int, std::vector<uint8_t>> tractorTrackPictures(mlt_filter filter, mlt_tractor tractor,
                                                         mlt_frame frame,
                                                         const LayerResolver& layers, int32_t width,
                                                         int32_t height) {
  std::map<int, std::vector<uint8_t>> pictures;
  for (int track : effectOf(filter).namedTracks(layers)) {
    mlt_frame trackFrame = tractorTrackFrame(tractor, frame, track);
    if (!trackFrame || mlt_frame_is_test_card(trackFrame)) continue;
    std::vector<uint8_t> resized;
    const uint8_t* picture = pictureOf(trackFrame, width, height, resized);
    if (!picture) continue;
    pictures[track] = resized.empty()
                          ? std::vector<uint8_t>(picture, picture + std::size_t(width) * height * 4)
                          : std::move(resized);
  }
  return pictures;
}

int filterImage(mlt_frame frame, uint8_t** image, mlt_image_format* format, int* width, int* height,
                int) {
  auto filter = static_cast<mlt_filter>(mlt_frame_pop_service(frame));
  EffectService& effect = effectOf(filter);
  mlt_properties noted = MLT_FRAME_PROPERTIES(frame);
  const mlt_position position = mlt_filter_get_position(filter, frame);
  const mlt_position length = mlt_filter_get_length2(filter, frame);

  mlt_tractor tractor = tractorOf(filter);
  LayerResolver layers = tractorResolver(tractor ? mlt_tractor_multitrack(tractor) : nullptr, -1);
  std::map<int, std::vector<uint8_t>> pictures;
  mlt_profile profile = mlt_service_profile(MLT_FILTER_SERVICE(filter));
  int32_t asked[2] = {*width > 0 ? *width : (profile ? profile->width : 0),
                      *height > 0 ? *height : (profile ? profile->height : 0)};
  if (tractor && asked[0] > 0 && asked[1] > 0)
    pictures = tractorTrackPictures(filter, tractor, frame, layers, asked[0], asked[1]);

  *format = mlt_image_rgba;
  int error = mlt_frame_get_image(frame, image, format, width, height, 1);
  if (error || !*image || *format != mlt_image_rgba) return error ? error : 1;
  const int32_t w = *width, h = *height;
  const std::size_t size = static_cast<std::size_t>(w) * h * 4;

  RenderRequest request;
  request.width = w;
  request.height = h;
  fillComposition(MLT_FILTER_SERVICE(filter), request);
  auto producer = static_cast<mlt_producer>(
      mlt_properties_get_data(noted, noteName(filter, "producer").c_str(), nullptr));
  // On a tractor the own picture is everything composited: shifts reach the kept pictures,
  // never a copy of the tractor, which would hold this filter too.
  request.own = effect.trackPictures(
      kOwnClip, mlt_properties_get_int(noted, noteName(filter, "position").c_str()), *image, w, h,
      tractor ? nullptr : producer, frame);
  request.own.length = mlt_properties_get_int(noted, noteName(filter, "length").c_str());
  // Where the copy cannot be made, the producer itself is sought, and the frame it gives
  // passes through this filter again.
  request.own.other = [filter, other = request.own.other](int32_t at, int32_t pictureWidth,
                                                          int32_t pictureHeight) {
    Fetching guard(filter);
    return other(at, pictureWidth, pictureHeight);
  };
  const int32_t at = static_cast<int32_t>(mlt_frame_get_position(frame));
  for (auto& [track, picture] : pictures) {
    if (asked[0] != w || asked[1] != h)
      picture = refhost::resizedPixels(picture.data(), asked[0], asked[1],
                                       refhost::PixelFormat::Rgba8, w, h);
    request.tracks[track] =
        effect.trackPictures(track, at, picture.data(), w, h,
                             mlt_multitrack_track(mlt_tractor_multitrack(tractor), track), frame);
  }

  auto* out = static_cast<uint8_t*>(mlt_pool_alloc(static_cast<int>(size)));
  if (!effect.render(static_cast<int>(position), static_cast<int>(length), layers, request, out)) {
    mlt_pool_release(out);
    return 0;  // the picture stays as it came
  }
  mlt_frame_set_image(frame, out, static_cast<int>(size), mlt_pool_release);
  *image = out;
  return 0;
}

mlt_frame filterProcess(mlt_filter filter, mlt_frame frame) {
  if (fetching.count(filter)) return frame;
  TrackTime time = trackTimeOf(filter, frame);
  mlt_properties noted = MLT_FRAME_PROPERTIES(frame);
  mlt_properties_set_int(noted, noteName(filter, "position").c_str(), time.position);
  mlt_properties_set_int(noted, noteName(filter, "length").c_str(), time.length);
  mlt_properties_set_data(noted, noteName(filter, "producer").c_str(), time.producer, 0, nullptr,
                          nullptr);
  mlt_frame_push_service(frame, filter);
  mlt_frame_push_get_image(frame, filterImage);
  return frame;
}

}  // namespace

mlt_filter makeFilter(const char* modulePath) {
  mlt_filter filter = mlt_filter_new();
  if (!filter) return nullptr;
  mlt_properties properties = MLT_FILTER_PROPERTIES(filter);
  if (modulePath && *modulePath) mlt_properties_set(properties, kModuleProperty, modulePath);
  mlt_properties_set_data(
      properties, kStateProperty, new EffectService(MLT_FILTER_SERVICE(filter), "the picture"), 0,
      [](void* state) { delete static_cast<EffectService*>(state); }, nullptr);
  filter->process = filterProcess;
  return filter;
}

}  // namespace veltrane_mlt
