// The transition: the upper track (b) is the effect's own source, and its inputs can show the
// lower track (a) and up to nine tracks of the tractor in all. Like MLT's own transitions it
// takes the frames of the tracks it shows from the services below it once per composition
// frame, puts its picture on the lower track's frame and hides the others, so that neither the
// tractor nor a later transition shows them again.
#include <algorithm>
#include <cstdio>
#include <cstring>
#include <memory>
#include <set>

#include "effect_service.h"
#include "mlt_services.h"
#include "refhost/media/rgba_image.h"
#include "track_frames.h"

namespace veltrane_mlt {
namespace {

const char* const kStateProperty = "_veltrane_state";

// What the transition holds between MLT's calls for the tracks of one composition frame.
struct Composition {
  explicit Composition(mlt_service service) : effect(service, "the upper track") {}
  EffectService effect;
  int lowest = 0;               // the track of held[0]
  std::vector<mlt_frame> held;  // the frames of tracks lowest.. for this composition frame
};

// Handed from the frame's making to its picture, on the lower track's frame.
struct ComposedFrame {
  mlt_frame upper = nullptr;
  std::map<int, mlt_frame> tracks;  // every track shown, the lower and upper included
  int lowerTrack = 0;
  int upperTrack = 0;
  LayerResolver layers;
};

// The lower track's frame carries what each composition on it needs under a name of its own: in
// a chain, several stack their pictures on the same frame.
std::string composedName(mlt_transition transition) {
  char name[48];
  std::snprintf(name, sizeof name, "_veltrane.%p", static_cast<void*>(transition));
  return name;
}

Composition& compositionOf(mlt_transition transition) {
  return *static_cast<Composition*>(
      mlt_properties_get_data(MLT_TRANSITION_PROPERTIES(transition), kStateProperty, nullptr));
}

int compositionImage(mlt_frame lowerFrame, uint8_t** image, mlt_image_format* format, int* width,
                     int* height, int) {
  auto transition = static_cast<mlt_transition>(mlt_frame_pop_service(lowerFrame));
  auto* composed = static_cast<ComposedFrame*>(mlt_properties_get_data(
      MLT_FRAME_PROPERTIES(lowerFrame), composedName(transition).c_str(), nullptr));
  Composition& composition = compositionOf(transition);
  const mlt_position at = mlt_frame_get_position(lowerFrame);
  const mlt_position position = mlt_transition_get_position(transition, lowerFrame);
  const mlt_position length = mlt_transition_get_length(transition);

  *format = mlt_image_rgba;
  uint8_t* lower = nullptr;
  int error = mlt_frame_get_image(lowerFrame, &lower, format, width, height, 1);
  if (error || !lower || *format != mlt_image_rgba) return error ? error : 1;
  const int32_t w = *width, h = *height;
  const std::size_t size = static_cast<std::size_t>(w) * h * 4;

  std::map<int, std::vector<uint8_t>> resized;
  const uint8_t* upper = pictureOf(composed->upper, w, h, resized[composed->upperTrack]);
  if (!upper) {
    *image = lower;  // nothing above: the lower track stays as it is
    return 0;
  }

  RenderRequest request;
  request.width = w;
  request.height = h;
  fillComposition(MLT_TRANSITION_SERVICE(transition), request);
  EffectService& effect = composition.effect;
  effect.history().readThrough(transition->producer);
  // The track pictures as the services below made them: a shifted input shows what lies
  // below, composited, wherever the kept pictures reach.
  auto trackPictures = [&](int track, mlt_frame frame, const uint8_t* current) {
    return effect.trackPictures(track, static_cast<int32_t>(at), current, w, h,
                                multitrackTrack(MLT_TRANSITION_SERVICE(transition), track), frame);
  };
  request.own = trackPictures(composed->upperTrack, composed->upper, upper);
  for (const auto& [track, frame] : composed->tracks) {
    const uint8_t* picture = track == composed->lowerTrack ? lower
                             : track == composed->upperTrack
                                 ? upper
                                 : pictureOf(frame, w, h, resized[track]);
    if (picture) request.tracks[track] = trackPictures(track, frame, picture);
  }

  auto* out = static_cast<uint8_t*>(mlt_pool_alloc(static_cast<int>(size)));
  if (!effect.render(static_cast<int>(position), static_cast<int>(length), composed->layers,
                     request, out))
    std::memcpy(out, upper, size);
  mlt_frame_set_image(lowerFrame, out, static_cast<int>(size), mlt_pool_release);
  *image = out;
  return 0;
}

bool hidden(mlt_frame frame) {
  return mlt_properties_get_int(MLT_FRAME_PROPERTIES(frame), "hide") & 1;
}

void hide(mlt_frame frame) {
  mlt_properties properties = MLT_FRAME_PROPERTIES(frame);
  mlt_properties_set_int(properties, "hide", mlt_properties_get_int(properties, "hide") | 1);
}

// Takes the frames of every track from the lowest to the highest the composition shows, and
// when it is active, stacks its picture on the lower track's frame and hides the rest.
void collectTracks(mlt_transition transition, Composition& composition) {
  mlt_properties properties = MLT_TRANSITION_PROPERTIES(transition);
  const int lowerTrack = mlt_properties_get_int(properties, "a_track");
  const int upperTrack = mlt_properties_get_int(properties, "b_track");
  mlt_service below = transition->producer;
  mlt_multitrack multitrack = multitrackOf(below);
  LayerResolver layers = tractorResolver(multitrack, lowerTrack);
  std::set<int> named = composition.effect.namedTracks(layers);
  std::set<int> shown = named;
  shown.insert(lowerTrack);
  shown.insert(upperTrack);
  composition.lowest = *shown.begin();
  composition.held.assign(static_cast<std::size_t>(*shown.rbegin() - composition.lowest + 1),
                          nullptr);
  for (std::size_t i = 0; i < composition.held.size(); ++i)
    mlt_service_get_frame(below, &composition.held[i], composition.lowest + static_cast<int>(i));
  auto frameOf = [&](int track) { return composition.held[track - composition.lowest]; };

  mlt_frame lower = frameOf(lowerTrack), upper = frameOf(upperTrack);
  if (!lower || !upper || lowerTrack == upperTrack || mlt_frame_is_test_card(upper) ||
      hidden(lower) || hidden(upper) || mlt_properties_get_int(properties, "disable"))
    return;
  const mlt_position in = mlt_properties_get_position(properties, "in");
  const mlt_position out = mlt_properties_get_position(properties, "out");
  const mlt_position at = mlt_frame_get_position(lower);
  if (!mlt_properties_get_int(properties, "always_active") && (at < in || (out && at > out)))
    return;

  auto composed = std::make_unique<ComposedFrame>();
  composed->upper = upper;
  composed->lowerTrack = lowerTrack;
  composed->upperTrack = upperTrack;
  composed->layers = layers;
  for (int track : shown) {
    if (frameOf(track)) composed->tracks[track] = frameOf(track);
  }
  mlt_properties_set_data(
      MLT_FRAME_PROPERTIES(lower), composedName(transition).c_str(), composed.release(), 0,
      [](void* data) { delete static_cast<ComposedFrame*>(data); }, nullptr);
  mlt_frame_push_service(lower, transition);
  mlt_frame_push_get_image(lower, compositionImage);
  for (int track : shown) {
    if (track != lowerTrack && frameOf(track)) hide(frameOf(track));
  }
}

// MLT asks a service in a tractor's field for the frame of each track in turn, from the
// bottom, until the last; the tracks are taken at the first ask and handed out after.
int compositionGetFrame(mlt_service service, mlt_frame_ptr frame, int index) {
  auto transition = static_cast<mlt_transition>(service->child);
  Composition& composition = compositionOf(transition);
  if (!transition->held) {
    collectTracks(transition, composition);
    transition->held = 1;
  }
  int error = 0;
  const int offset = index - composition.lowest;
  if (offset >= 0 && offset < static_cast<int>(composition.held.size()) &&
      composition.held[static_cast<std::size_t>(offset)])
    *frame = composition.held[static_cast<std::size_t>(offset)];
  else
    error = mlt_service_get_frame(transition->producer, frame, index);
  transition->held =
      !(*frame && mlt_properties_get_int(MLT_FRAME_PROPERTIES(*frame), "last_track"));
  return error;
}

}  // namespace

mlt_transition makeTransition(const char* modulePath) {
  mlt_transition transition = mlt_transition_new();
  if (!transition) return nullptr;
  mlt_properties properties = MLT_TRANSITION_PROPERTIES(transition);
  if (modulePath && *modulePath) mlt_properties_set(properties, kModuleProperty, modulePath);
  // MLT asks each transition which of picture (1) and sound (2) it mixes.
  mlt_properties_set_int(properties, "_transition_type", 1);
  mlt_properties_set_data(
      properties, kStateProperty, new Composition(MLT_TRANSITION_SERVICE(transition)), 0,
      [](void* state) { delete static_cast<Composition*>(state); }, nullptr);
  MLT_TRANSITION_SERVICE(transition)->get_frame = compositionGetFrame;
  return transition;
}

}  // namespace veltrane_mlt
