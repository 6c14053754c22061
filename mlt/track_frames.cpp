// Seeking tracks for time-shifted pictures at the render's size.
#include "track_frames.h"

#include "refhost/media/rgba_image.h"

namespace veltrane_mlt {

mlt_multitrack multitrackOf(mlt_service service) {
  // A tractor's field chains its filters and transitions one after another in front of the
  // multitrack; the first input of each leads down to it.
  for (int depth = 0; service && depth < 1000; ++depth) {
    if (mlt_service_identify(service) == mlt_service_multitrack_type)
      return reinterpret_cast<mlt_multitrack>(service);
    service = mlt_service_producer(service);
  }
  return nullptr;
}

mlt_producer multitrackTrack(mlt_service service, int index) {
  mlt_multitrack multitrack = multitrackOf(service);
  if (!multitrack || index < 0 || index >= mlt_multitrack_count(multitrack)) return nullptr;
  return mlt_multitrack_track(multitrack, index);
}

bool canSeek(mlt_producer producer) {
  if (!producer || mlt_producer_get_playtime(producer) <= 0) return false;
  mlt_properties properties = MLT_PRODUCER_PROPERTIES(producer);
  return !mlt_properties_get(properties, "seekable") ||
         mlt_properties_get_int(properties, "seekable") != 0;
}

namespace {

bool saysUnseekable(mlt_producer producer) {
  if (!producer) return false;
  mlt_properties properties = MLT_PRODUCER_PROPERTIES(producer);
  return mlt_properties_get(properties, "seekable") &&
         mlt_properties_get_int(properties, "seekable") == 0;
}

}  // namespace

bool clipCanSeek(mlt_frame frame) {
  mlt_producer clip = mlt_frame_get_original_producer(frame);
  return !saysUnseekable(clip) && !(clip && saysUnseekable(mlt_producer_cut_parent(clip)));
}

namespace {

// Puts the play head back without mlt_producer_seek's side effect at the end: seeking to the
// end pauses a producer, which a play head one past its last frame (where reading in order
// leaves it) must not do.
void restorePosition(mlt_producer producer, mlt_position position) {
  if (position >= 0 && position < mlt_producer_get_playtime(producer)) {
    mlt_producer_seek(producer, position);
    return;
  }
  mlt_properties properties = MLT_PRODUCER_PROPERTIES(producer);
  mlt_properties_set_position(properties, "_position", position);
  mlt_properties_set_position(properties, "_frame", mlt_producer_get_in(producer) + position);
}

}  // namespace

std::vector<uint8_t> pictureAt(mlt_producer producer, int32_t position, int32_t width,
                               int32_t height, mlt_frame like) {
  if (!canSeek(producer) || position < 0 || position >= mlt_producer_get_playtime(producer) ||
      width <= 0 || height <= 0)
    return {};
  mlt_service service = MLT_PRODUCER_SERVICE(producer);
  mlt_frame frame = nullptr;
  const mlt_position before = mlt_producer_position(producer);
  mlt_producer_seek(producer, position);
  int failed = mlt_service_get_frame(service, &frame, 0);
  restorePosition(producer, before);
  if (failed || !frame) {
    if (frame) mlt_frame_close(frame);
    return {};
  }
  if (like) {
    mlt_properties_pass_list(MLT_FRAME_PROPERTIES(frame), MLT_FRAME_PROPERTIES(like),
                             "rescale.interp, consumer_deinterlace, deinterlace_method, "
                             "consumer_tff, consumer_color_trc, consumer.progressive");
    mlt_frame_set_aspect_ratio(frame, mlt_frame_get_aspect_ratio(like));
  }
  mlt_image_format format = mlt_image_rgba;
  int frameWidth = width, frameHeight = height;
  uint8_t* image = nullptr;
  std::vector<uint8_t> picture;
  if (!mlt_frame_get_image(frame, &image, &format, &frameWidth, &frameHeight, 0) && image &&
      format == mlt_image_rgba && frameWidth > 0 && frameHeight > 0) {
    picture = refhost::resizedPixels(image, frameWidth, frameHeight, refhost::PixelFormat::Rgba8,
                                     width, height);
  }
  mlt_frame_close(frame);
  return picture;
}

const uint8_t* pictureOf(mlt_frame frame, int32_t width, int32_t height,
                         std::vector<uint8_t>& resized) {
  mlt_image_format format = mlt_image_rgba;
  int frameWidth = width, frameHeight = height;
  uint8_t* image = nullptr;
  if (mlt_frame_get_image(frame, &image, &format, &frameWidth, &frameHeight, 0) || !image ||
      format != mlt_image_rgba || frameWidth <= 0 || frameHeight <= 0)
    return nullptr;
  if (frameWidth == width && frameHeight == height) return image;
  resized = refhost::resizedPixels(image, frameWidth, frameHeight, refhost::PixelFormat::Rgba8,
                                   width, height);
  return resized.data();
}

}  // namespace veltrane_mlt
