// Output targets by name, and the three frame sinks.
#include "refhost/pipeline/frame_output.h"

#include <algorithm>
#include <cctype>
#include <map>
#include <mutex>
#include <stdexcept>

#include "refhost/platform/staged_file.h"

namespace refhost {
namespace {

std::string lowerExtension(const std::string& path) {
  std::string::size_type dot = path.rfind('.');
  if (dot == std::string::npos || path.find('/', dot) != std::string::npos) return "";
  std::string extension = path.substr(dot + 1);
  std::transform(extension.begin(), extension.end(), extension.begin(),
                 [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
  return extension;
}

// The frame-number conversion of a sequence pattern: where it starts and ends, and its width.
struct NumberField {
  std::string::size_type begin = 0, end = 0;
  int width = 0;
};

NumberField numberField(const std::string& pattern) {
  std::string::size_type percent = pattern.find('%');
  if (percent == std::string::npos || pattern.find('%', percent + 1) != std::string::npos)
    throw std::invalid_argument("a sequence pattern holds exactly one %0Nd or %d, got '" + pattern +
                                "'");
  std::string::size_type at = percent + 1;
  while (at < pattern.size() && std::isdigit(static_cast<unsigned char>(pattern[at]))) ++at;
  if (at >= pattern.size() || pattern[at] != 'd' || at - percent > 3)
    throw std::invalid_argument("a sequence pattern holds %0Nd or %d (N up to 2 digits), got '" +
                                pattern + "'");
  NumberField field;
  field.begin = percent;
  field.end = at + 1;
  field.width = at > percent + 1 ? std::stoi(pattern.substr(percent + 1, at - percent - 1)) : 0;
  return field;
}

ImageFormat imageFormatOf(const std::string& extension) {
  return extension == "exr" ? ImageFormat::Exr : ImageFormat::Png;
}

class StillSink : public FrameSink {
 public:
  explicit StillSink(const OutputTarget& target) : target_(target), file_(target.path) {}
  void write(int32_t, const RgbaImage& picture) override {
    if (written_) throw std::runtime_error(target_.path + ": a still image holds one frame");
    std::vector<uint8_t> bytes =
        encodeImage(picture, target_.imageFormat, target_.path, target_.imageBitDepth);
    file_.write(bytes.data(), bytes.size());
    written_ = true;
  }
  std::vector<std::string> commit() override {
    if (!written_) throw std::runtime_error(target_.path + ": no frame was rendered");
    file_.commit();
    return {target_.path};
  }

 private:
  OutputTarget target_;
  StagedFile file_;
  bool written_ = false;
};

// Frames wait in a hidden folder until the last one is written, so a sequence that fails
// part-way leaves none of its frames.
class SequenceSink : public FrameSink {
 public:
  explicit SequenceSink(const OutputTarget& target) : target_(target), files_(target.path) {}
  void write(int32_t frame, const RgbaImage& picture) override {
    const std::string name = target_.frameName(frame);
    // Frames may come from several writers at once: each encodes its own and hands the bytes
    // over under the lock.
    const std::vector<uint8_t> bytes =
        encodeImage(picture, target_.imageFormat, name, target_.imageBitDepth);
    std::lock_guard<std::mutex> lock(mutex_);
    files_.write(name, bytes.data(), bytes.size());
    names_[frame] = name;
  }
  bool concurrentWrites() const override { return true; }
  std::vector<std::string> commit() override {
    files_.commit();
    std::vector<std::string> names;
    for (const auto& entry : names_) names.push_back(entry.second);
    return names;
  }

 private:
  OutputTarget target_;
  std::mutex mutex_;
  StagedFileSet files_;
  std::map<int32_t, std::string> names_;  // by frame, so the names come out in frame order
};

class VideoSink : public FrameSink {
 public:
  VideoSink(const OutputTarget& target, int32_t width, int32_t height, FrameRate frameRate,
            const std::vector<AudioClip>& audio)
      : target_(target),
        file_(target.path),
        writer_(std::make_unique<VideoWriter>(file_.temporaryPath(), target.container, width,
                                              height, frameRate, target.video, target.path,
                                              audio)) {}
  ~VideoSink() override { writer_.reset(); }  // closes the file before the temporary goes
  void write(int32_t, const RgbaImage& picture) override { writer_->write(picture); }
  std::vector<std::string> commit() override {
    writer_->finish();
    writer_.reset();
    syncFile(file_.temporaryPath(), target_.path);
    file_.commit();
    return {target_.path};
  }
  std::string note() const override { return writer_ ? writer_->note() : ""; }

 private:
  OutputTarget target_;
  StagedFile file_;
  std::unique_ptr<VideoWriter> writer_;
};

}  // namespace

std::string OutputTarget::frameName(int32_t frame) const {
  NumberField field = numberField(path);
  std::string number = std::to_string(frame < 0 ? -static_cast<int64_t>(frame) : frame);
  if (static_cast<int>(number.size()) < field.width)
    number.insert(0, static_cast<std::size_t>(field.width) - number.size(), '0');
  if (frame < 0) number.insert(0, "-");
  return path.substr(0, field.begin) + number + path.substr(field.end);
}

OutputTarget parseOutputTarget(const std::string& path) {
  OutputTarget target;
  target.path = path;
  std::string extension = lowerExtension(path);
  if (path.find('%') != std::string::npos) {
    numberField(path);
    if (path.find('/', path.find('%')) != std::string::npos)
      throw std::invalid_argument(
          "a sequence's frame number goes in the file name, not a folder's, got '" + path + "'");
    if (extension != "png" && extension != "exr")
      throw std::invalid_argument("an image sequence pattern ends in .png or .exr, got '" + path +
                                  "'");
    target.kind = OutputKind::Sequence;
    target.imageFormat = imageFormatOf(extension);
  } else if (extension == "png" || extension == "exr") {
    target.kind = OutputKind::Still;
    target.imageFormat = imageFormatOf(extension);
  } else if (extension == "mp4" || extension == "mov" || extension == "mkv" ||
             extension == "webm") {
    target.kind = OutputKind::Video;
    target.container = extension == "mp4"   ? VideoContainer::Mp4
                       : extension == "mov" ? VideoContainer::Mov
                       : extension == "mkv" ? VideoContainer::Mkv
                                            : VideoContainer::Webm;
    target.video = encodingFor(defaultCodec(target.container));
  } else {
    throw std::invalid_argument(
        "the output name ends in .png, .exr, .mp4, .mov, .mkv or .webm, or is a "
        "pattern with %04d ending in .png or .exr; got '" +
        path + "'");
  }
  return target;
}

std::unique_ptr<FrameSink> openFrameSink(const OutputTarget& target, int32_t width, int32_t height,
                                         FrameRate frameRate, const std::vector<AudioClip>& audio) {
  switch (target.kind) {
    case OutputKind::Still:
      return std::make_unique<StillSink>(target);
    case OutputKind::Sequence:
      return std::make_unique<SequenceSink>(target);
    case OutputKind::Video:
      return std::make_unique<VideoSink>(target, width, height, frameRate, audio);
  }
  return nullptr;
}

}  // namespace refhost
