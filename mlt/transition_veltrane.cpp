// The transition: the upper track (b) is the effect's own source, the lower track (a) a layer
// its inputs can pick ("lower"); the result replaces the lower track's picture.
#include <cstring>

#include "effect_service.h"
#include "mlt_services.h"
#include "refhost/media/rgba_image.h"
#include "track_frames.h"

namespace veltrane_mlt {
namespace {

const char* const kStateProperty = "_veltrane_state";

EffectService& effectOf(mlt_transition transition) {
  return *static_cast<EffectService*>(
      mlt_properties_get_data(MLT_TRANSITION_PROPERTIES(transition), kStateProperty, nullptr));
}

// The pictures of one of the transition's tracks: the frame in hand and, where the track can be
// sought, its pictures at other composition positions.
TrackPictures trackPictures(mlt_transition transition, const char* trackProperty, mlt_frame frame,
                            mlt_position position, const uint8_t* current) {
  TrackPictures track;
  track.position = static_cast<int32_t>(position);
  track.length = track.position + 1;
  track.current = current;
  mlt_properties properties = MLT_TRANSITION_PROPERTIES(transition);
  mlt_producer producer = multitrackTrack(MLT_TRANSITION_SERVICE(transition),
                                          mlt_properties_get_int(properties, trackProperty));
  if (canSeek(producer) && clipCanSeek(frame)) {
    track.length = static_cast<int32_t>(mlt_producer_get_playtime(producer));
    track.other = [producer, frame](int32_t at, int32_t width, int32_t height) {
      return pictureAt(producer, at, width, height, frame);
    };
  }
  return track;
}

int transitionImage(mlt_frame lowerFrame, uint8_t** image, mlt_image_format* format, int* width,
                    int* height, int) {
  mlt_frame upperFrame = mlt_frame_pop_frame(lowerFrame);
  auto transition = static_cast<mlt_transition>(mlt_frame_pop_service(lowerFrame));
  const mlt_position composition = mlt_frame_get_position(lowerFrame);
  const mlt_position position = mlt_transition_get_position(transition, lowerFrame);
  const mlt_position length = mlt_transition_get_length(transition);

  *format = mlt_image_rgba;
  uint8_t* lower = nullptr;
  int error = mlt_frame_get_image(lowerFrame, &lower, format, width, height, 1);
  if (error || !lower || *format != mlt_image_rgba) return error ? error : 1;
  const int32_t w = *width, h = *height;
  const std::size_t size = static_cast<std::size_t>(w) * h * 4;

  // The upper track at the lower one's size, whatever size it came at.
  mlt_image_format upperFormat = mlt_image_rgba;
  int upperWidth = w, upperHeight = h;
  uint8_t* upper = nullptr;
  std::vector<uint8_t> resized;
  if (mlt_frame_get_image(upperFrame, &upper, &upperFormat, &upperWidth, &upperHeight, 0) ||
      !upper || upperFormat != mlt_image_rgba) {
    *image = lower;  // nothing above: the lower track stays as it is
    return 0;
  }
  if (upperWidth != w || upperHeight != h) {
    resized =
        refhost::resizedPixels(upper, upperWidth, upperHeight, refhost::PixelFormat::Rgba8, w, h);
    upper = resized.data();
  }

  RenderRequest request;
  request.width = w;
  request.height = h;
  fillComposition(MLT_TRANSITION_SERVICE(transition), request);
  request.own = trackPictures(transition, "b_track", upperFrame, composition, upper);
  request.lower = trackPictures(transition, "a_track", lowerFrame, composition, lower);

  auto* out = static_cast<uint8_t*>(mlt_pool_alloc(static_cast<int>(size)));
  if (!effectOf(transition)
           .render(static_cast<int>(position), static_cast<int>(length), request, out))
    std::memcpy(out, upper, size);
  mlt_frame_set_image(lowerFrame, out, static_cast<int>(size), mlt_pool_release);
  *image = out;
  return 0;
}

mlt_frame transitionProcess(mlt_transition transition, mlt_frame lowerFrame, mlt_frame upperFrame) {
  mlt_frame_push_service(lowerFrame, transition);
  mlt_frame_push_frame(lowerFrame, upperFrame);
  mlt_frame_push_get_image(lowerFrame, transitionImage);
  return lowerFrame;
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
      properties, kStateProperty,
      new EffectService(MLT_TRANSITION_SERVICE(transition), true, "the upper track"), 0,
      [](void* state) { delete static_cast<EffectService*>(state); }, nullptr);
  transition->process = transitionProcess;
  return transition;
}

}  // namespace veltrane_mlt
