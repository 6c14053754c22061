// Copying the tracks and the services below a transition, and reading a track through them.
#include "below_copy.h"

#include <algorithm>
#include <cstring>

#include "track_frames.h"
#include "track_history.h"

namespace veltrane_mlt {
namespace {

// MLT's service names for the framework's own service kinds.
bool isKind(mlt_service service, mlt_service_type type, const char* typeName) {
  const char* name = mlt_properties_get(MLT_SERVICE_PROPERTIES(service), "mlt_type");
  return mlt_service_identify(service) == type || (name && std::strcmp(name, typeName) == 0);
}

// A service of the same kind and name with the same properties; null when it cannot be made.
bool plantCopy(mlt_field field, mlt_profile profile, mlt_service service) {
  mlt_properties properties = MLT_SERVICE_PROPERTIES(service);
  const char* name = mlt_properties_get(properties, "mlt_service");
  if (!name) return false;
  if (isKind(service, mlt_service_transition_type, "transition")) {
    mlt_transition copy = mlt_factory_transition(profile, name, nullptr);
    if (!copy) return false;
    mlt_properties_inherit(MLT_TRANSITION_PROPERTIES(copy), properties);
    mlt_field_plant_transition(field, copy, mlt_properties_get_int(properties, "a_track"),
                               mlt_properties_get_int(properties, "b_track"));
    mlt_transition_close(copy);
    return true;
  }
  if (isKind(service, mlt_service_filter_type, "filter")) {
    mlt_filter copy = mlt_factory_filter(profile, name, nullptr);
    if (!copy) return false;
    mlt_properties_inherit(MLT_FILTER_PROPERTIES(copy), properties);
    mlt_field_plant_filter(field, copy, mlt_properties_get_int(properties, "track"));
    mlt_filter_close(copy);
    return true;
  }
  return false;
}

}  // namespace

BelowCopy::BelowCopy(mlt_service below) : source_(below) {
  std::vector<mlt_service> services;  // from the transition's input down
  mlt_multitrack multitrack = nullptr;
  for (mlt_service service = below; service && services.size() < 1000;
       service = mlt_service_producer(service)) {
    if (mlt_service_identify(service) == mlt_service_multitrack_type) {
      multitrack = reinterpret_cast<mlt_multitrack>(service);
      break;
    }
    services.push_back(service);
  }
  mlt_profile profile = below ? mlt_service_profile(below) : nullptr;
  if (!multitrack || !profile) return;
  mlt_tractor tractor = mlt_tractor_new();
  if (!tractor) return;
  mlt_properties_set_data(MLT_TRACTOR_PROPERTIES(tractor), "_profile", profile, 0, nullptr,
                          nullptr);
  bool copied = true;
  for (int i = 0; copied && i < mlt_multitrack_count(multitrack); ++i) {
    mlt_producer track = copyOfProducer(mlt_multitrack_track(multitrack, i));
    copied = track && mlt_tractor_set_track(tractor, track, i) == 0;
    if (track) mlt_producer_close(track);
  }
  mlt_field field = mlt_tractor_field(tractor);
  for (auto service = services.rbegin(); copied && service != services.rend(); ++service)
    copied = field && plantCopy(field, profile, *service);
  if (!copied) {
    mlt_tractor_close(tractor);
    return;
  }
  tractor_ = tractor;
}

BelowCopy::~BelowCopy() {
  if (tractor_) mlt_tractor_close(tractor_);
}

std::vector<uint8_t> BelowCopy::pictureAt(int track, int32_t position, int32_t width,
                                          int32_t height, mlt_frame like) {
  mlt_multitrack multitrack = ready() ? mlt_tractor_multitrack(tractor_) : nullptr;
  if (!multitrack || track < 0 || track >= mlt_multitrack_count(multitrack) || position < 0 ||
      width <= 0 || height <= 0)
    return {};
  mlt_producer_seek(MLT_MULTITRACK_PRODUCER(multitrack), position);
  // The tractor's way: every track's frame from the last service of the field (the one the
  // tractor reads), up to the last track.
  mlt_service top = mlt_service_producer(MLT_TRACTOR_SERVICE(tractor_));
  std::vector<mlt_frame> frames;
  for (int i = 0; i <= mlt_multitrack_count(multitrack); ++i) {
    mlt_frame frame = nullptr;
    if (mlt_service_get_frame(top, &frame, i) || !frame) break;
    frames.push_back(frame);
    if (mlt_properties_get_int(MLT_FRAME_PROPERTIES(frame), "last_track")) break;
  }
  std::vector<uint8_t> picture;
  if (track < static_cast<int>(frames.size()) &&
      !mlt_frame_is_test_card(frames[static_cast<std::size_t>(track)])) {
    mlt_frame frame = frames[static_cast<std::size_t>(track)];
    if (like)
      mlt_properties_pass_list(MLT_FRAME_PROPERTIES(frame), MLT_FRAME_PROPERTIES(like),
                               "rescale.interp, consumer_deinterlace, deinterlace_method");
    std::vector<uint8_t> resized;
    const uint8_t* pixels = pictureOf(frame, width, height, resized);
    if (pixels)
      picture = resized.empty()
                    ? std::vector<uint8_t>(pixels, pixels + std::size_t(width) * height * 4)
                    : std::move(resized);
  }
  for (mlt_frame frame : frames) mlt_frame_close(frame);
  return picture;
}

}  // namespace veltrane_mlt
