// Kept pictures and the readers that read on ahead of them.
#include "track_history.h"

#include <cstring>
#include <string>

#include "mlt_services.h"
#include "track_frames.h"

namespace veltrane_mlt {

struct TrackHistory::Reader {
  explicit Reader(mlt_producer of) : copy(copyOfProducer(of)) {}
  ~Reader() {
    if (copy) mlt_producer_close(copy);
  }
  Reader(const Reader&) = delete;
  Reader& operator=(const Reader&) = delete;
  mlt_producer copy;
};

mlt_producer copyOfProducer(mlt_producer producer) {
  if (!producer) return nullptr;
  mlt_service service = MLT_PRODUCER_SERVICE(producer);
  mlt_profile profile = mlt_service_profile(service);
  mlt_consumer writer = mlt_factory_consumer(profile, "xml", "string");
  if (!writer) return nullptr;
  mlt_properties settings = MLT_CONSUMER_PROPERTIES(writer);
  // Paths stay as the producers hold them (absolute once read), with nothing of the editors'.
  mlt_properties_set(settings, "root", "");
  mlt_properties_set_int(settings, "no_meta", 1);
  mlt_consumer_connect(writer, service);
  mlt_consumer_start(writer);
  const char* text = mlt_properties_get(settings, "string");
  const std::string document = text ? text : "";
  mlt_consumer_stop(writer);
  mlt_consumer_close(writer);
  if (document.empty()) return nullptr;
  mlt_producer copy = mlt_factory_producer(profile, "xml-string", document.c_str());
  if (copy && mlt_producer_get_playtime(copy) <= 0) {
    mlt_producer_close(copy);
    return nullptr;
  }
  // A split-screen filter on the producer itself is the one reading it: its copy stays out of
  // the copied pictures.
  mlt_service copied = copy ? MLT_PRODUCER_SERVICE(copy) : nullptr;
  for (int i = 0; copied && mlt_service_filter(copied, i); ++i) {
    mlt_properties filter = MLT_FILTER_PROPERTIES(mlt_service_filter(copied, i));
    const char* name = mlt_properties_get(filter, "mlt_service");
    if (name && std::string(name) == kServiceName) mlt_properties_set_int(filter, "disable", 1);
  }
  return copy;
}

TrackHistory::TrackHistory(std::size_t byteBudget) : budget_(byteBudget) {}

TrackHistory::~TrackHistory() = default;

void TrackHistory::keep(int track, int32_t position, const uint8_t* rgba, int32_t width,
                        int32_t height, int32_t depth) {
  if (!rgba || width <= 0 || height <= 0 || depth <= 0) return;
  const std::size_t size = std::size_t(width) * height * 4;
  if (size > budget_) return;
  std::lock_guard<std::mutex> lock(mutex_);
  for (const Kept& kept : kept_) {
    if (kept.track == track && kept.position == position && kept.picture.width == width &&
        kept.picture.height == height)
      return;
  }
  while (!kept_.empty() && bytes_ + size > budget_) {
    bytes_ -= kept_.front().picture.pixels.size();
    kept_.pop_front();
  }
  Kept kept{track, position, {width, height, std::vector<uint8_t>(rgba, rgba + size)}};
  kept_.push_back(std::move(kept));
  bytes_ += size;
  int32_t ofTrack = 0;
  for (auto at = kept_.end(); at != kept_.begin();) {
    --at;
    if (at->track != track || ++ofTrack <= depth) continue;
    bytes_ -= at->picture.pixels.size();
    at = kept_.erase(at);
  }
}

std::vector<uint8_t> TrackHistory::find(int track, int32_t position, int32_t width, int32_t height,
                                        mlt_producer producer, mlt_frame like) {
  std::lock_guard<std::mutex> lock(mutex_);
  for (auto kept = kept_.rbegin(); kept != kept_.rend(); ++kept) {
    if (kept->track == track && kept->position == position && kept->picture.width == width &&
        kept->picture.height == height)
      return kept->picture.pixels;
  }
  if (!canSeek(producer) || !clipCanSeek(like)) return {};
  if (below_) {
    if (!belowCopy_ || belowCopy_->source() != below_)
      belowCopy_ = std::make_unique<BelowCopy>(below_);
    if (belowCopy_->ready()) return belowCopy_->pictureAt(track, position, width, height, like);
  }
  std::unique_ptr<Reader>& reader = readers_[track];
  if (!reader) reader = std::make_unique<Reader>(producer);
  // A producer that cannot be copied is sought itself, as a last resort.
  return pictureAt(reader->copy ? reader->copy : producer, position, width, height, like);
}

void TrackHistory::readThrough(mlt_service below) {
  std::lock_guard<std::mutex> lock(mutex_);
  below_ = below;
}

std::size_t TrackHistory::keptBytes() const {
  std::lock_guard<std::mutex> lock(mutex_);
  return bytes_;
}

}  // namespace veltrane_mlt
