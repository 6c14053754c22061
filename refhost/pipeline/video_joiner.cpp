// Reading the headers of video pieces and copying their packets, checked piece by piece, into
// the joined file, with its sound written along as a render writes it.
#include "refhost/pipeline/video_joiner.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/pixdesc.h>
}

#include <algorithm>
#include <cctype>
#include <limits>
#include <memory>
#include <sstream>

#include "refhost/media/audio_track.h"
#include "refhost/media/ffmpeg_utilities.h"
#include "refhost/pipeline/video_writer.h"

namespace refhost {
namespace {

struct InputCloser {
  void operator()(AVFormatContext* input) const { avformat_close_input(&input); }
};
using Input = std::unique_ptr<AVFormatContext, InputCloser>;

Input openPiece(const std::string& path) {
  AVFormatContext* raw = nullptr;
  int result = avformat_open_input(&raw, path.c_str(), nullptr, nullptr);
  if (result < 0) throw std::runtime_error(path + ": cannot read it (" + avErrorText(result) + ")");
  return Input(raw);
}

// The rate as FFmpeg keeps it: int parts, in lowest terms so that they fit.
AVRational rationalOf(FrameRate rate) {
  const FrameRate lowest = reduced(rate);
  return AVRational{static_cast<int>(lowest.numerator), static_cast<int>(lowest.denominator)};
}

int videoStreamOf(const AVFormatContext& input, const std::string& path) {
  for (unsigned i = 0; i < input.nb_streams; ++i)
    if (input.streams[i]->codecpar->codec_type == AVMEDIA_TYPE_VIDEO) return static_cast<int>(i);
  throw std::runtime_error(path + ": holds no video");
}

// Everything of a stream that a decoder of the joined stream relies on, the codec's own
// configuration (extradata) byte for byte: pieces whose texts differ cannot share one stream.
std::string parametersText(const AVCodecParameters& codec) {
  std::ostringstream text;
  const char* pixels = av_get_pix_fmt_name(static_cast<AVPixelFormat>(codec.format));
  text << avcodec_get_name(codec.codec_id) << " " << codec.width << "x" << codec.height << " "
       << (pixels ? pixels : "?") << " profile " << codec.profile << " level " << codec.level
       << " colour " << codec.color_space << "/" << codec.color_primaries << "/" << codec.color_trc
       << "/" << codec.color_range << " aspect " << codec.sample_aspect_ratio.num << ":"
       << codec.sample_aspect_ratio.den << " config ";
  text << std::hex;
  for (int i = 0; i < codec.extradata_size; ++i) text << static_cast<int>(codec.extradata[i]);
  return text.str();
}

struct OutputCloser {
  void operator()(AVFormatContext* output) const {
    if (output->pb) avio_closep(&output->pb);
    avformat_free_context(output);
  }
};

// The joined file being written.
class JoinedFile {
 public:
  JoinedFile(const JoinedVideo& video, const AVCodecParameters& parameters)
      : video_(video), frameRate_(rationalOf(video.frameRate)) {
    AVFormatContext* raw = nullptr;
    int result = avformat_alloc_output_context2(&raw, nullptr, muxerName(video.container),
                                                video.path.c_str());
    if (result < 0 || !raw) fail("no muxer", result);
    output_.reset(raw);
    stream_ = avformat_new_stream(raw, nullptr);
    if (!stream_ || avcodec_parameters_copy(stream_->codecpar, &parameters) < 0)
      fail("out of memory");
    stream_->codecpar->codec_tag =
        videoCodecTag(avcodec_get_name(parameters.codec_id), video.container);
    // The stream is timed in frames, as the writer times a render's.
    stream_->time_base = av_inv_q(frameRate_);
    stream_->avg_frame_rate = frameRate_;
    if (!video.audio.empty()) audio_ = AudioTrack::open(video.audio, raw);
    if ((result = avio_open(&raw->pb, video.path.c_str(), AVIO_FLAG_WRITE)) < 0)
      fail("cannot create the file", result);
    if ((result = avformat_write_header(raw, nullptr)) < 0) fail("cannot write the header", result);
  }

  // Frames are the unit the pieces' timestamps are compared in.
  AVRational frameTime() const { return av_inv_q(frameRate_); }

  // A packet timed in frames.
  void write(AVPacket* packet) {
    const double end = static_cast<double>(packet->pts + packet->duration) * av_q2d(frameTime());
    av_packet_rescale_ts(packet, frameTime(), stream_->time_base);
    packet->stream_index = stream_->index;
    const int result = av_interleaved_write_frame(output_.get(), packet);
    if (result < 0) fail("writing a packet failed", result);
    // The sound goes along with the pictures, as in a render, so the muxer interleaves alike.
    if (audio_) audio_->writeUntil(end);
  }

  void finish() {
    if (audio_) audio_->finish();
    int result = av_write_trailer(output_.get());
    if (result < 0) fail("cannot complete the file", result);
    if ((result = avio_closep(&output_->pb)) < 0) fail("cannot close the file", result);
  }

 private:
  [[noreturn]] void fail(const std::string& what, int code = 0) const {
    throw std::runtime_error(video_.shownName + ": cannot write video: " + what +
                             (code ? " (" + avErrorText(code) + ")" : ""));
  }

  const JoinedVideo& video_;
  const AVRational frameRate_;
  std::unique_ptr<AVFormatContext, OutputCloser> output_;
  AVStream* stream_ = nullptr;
  std::unique_ptr<AudioTrack> audio_;  // after output_, so it goes first
};

// A frame number from a piece's timestamp: the nearest, since containers that count time in
// milliseconds round frames of rates such as 30000/1001.
int64_t inFrames(int64_t timestamp, AVRational from, AVRational frame) {
  if (timestamp == AV_NOPTS_VALUE) return AV_NOPTS_VALUE;
  return av_rescale_q_rnd(timestamp, from, frame,
                          static_cast<AVRounding>(AV_ROUND_NEAR_INF | AV_ROUND_PASS_MINMAX));
}

// Copies one piece's packets, checking that they are exactly its frames. `lastDecode` is the
// decoding time of the packet written before, which the piece must go on from.
void copyPiece(std::size_t index, const PieceToJoin& piece, const std::string& parameters,
               JoinedFile& joined, int64_t& lastDecode) {
  auto mismatch = [&](const std::string& what) {
    throw PieceMismatch(index, piece.path + ": " + what);
  };
  Input input = openPiece(piece.path);
  const int video = videoStreamOf(*input, piece.path);
  const AVStream& stream = *input->streams[video];
  if (parametersText(*stream.codecpar) != parameters)
    mismatch("its video is encoded otherwise than the first piece's (" +
             parametersText(*stream.codecpar).substr(0, 60) + "...)");
  std::vector<bool> seen(static_cast<std::size_t>(piece.frameCount), false);
  int32_t count = 0;
  std::unique_ptr<AVPacket, void (*)(AVPacket*)> packet(av_packet_alloc(),
                                                        [](AVPacket* p) { av_packet_free(&p); });
  int result = 0;
  while ((result = av_read_frame(input.get(), packet.get())) >= 0) {
    if (packet->stream_index != video) {
      av_packet_unref(packet.get());
      continue;
    }
    packet->pts = inFrames(packet->pts, stream.time_base, joined.frameTime());
    packet->dts = inFrames(packet->dts, stream.time_base, joined.frameTime());
    // Every frame of a rendered video lasts one frame, as the writer wrote it; containers that
    // keep no duration for some packets (Matroska) leave it to be said again.
    packet->duration = 1;
    const int64_t place = packet->pts - piece.firstFrame;
    if (packet->pts == AV_NOPTS_VALUE || place < 0 || place >= piece.frameCount ||
        seen[static_cast<std::size_t>(place)])
      mismatch("holds a frame at " + std::to_string(packet->pts) + " outside its frames " +
               std::to_string(piece.firstFrame) + "-" +
               std::to_string(piece.firstFrame + piece.frameCount - 1) + " or twice");
    if (count == 0 && !(packet->flags & AV_PKT_FLAG_KEY)) mismatch("does not start on a keyframe");
    if (packet->dts == AV_NOPTS_VALUE || packet->dts <= lastDecode)
      mismatch("its decoding order runs back into the frames before it");
    seen[static_cast<std::size_t>(place)] = true;
    lastDecode = packet->dts;
    ++count;
    joined.write(packet.get());
    av_packet_unref(packet.get());
  }
  if (result != AVERROR_EOF) mismatch("cannot be read to its end (" + avErrorText(result) + ")");
  if (count != piece.frameCount)
    mismatch("is incomplete: " + std::to_string(count) + " of its " +
             std::to_string(piece.frameCount) + " frames");
}

}  // namespace

PieceHeader readPieceHeader(const std::string& path) {
  Input input = openPiece(path);
  const AVStream& stream = *input->streams[videoStreamOf(*input, path)];
  PieceHeader header;
  header.streamParameters = parametersText(*stream.codecpar);
  const AVDictionaryEntry* tag = nullptr;
  while ((tag = av_dict_get(input->metadata, "", tag, AV_DICT_IGNORE_SUFFIX))) {
    std::string key = tag->key;
    std::transform(key.begin(), key.end(), key.begin(),
                   [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    header.tags[key] = tag->value;
  }
  return header;
}

void joinPieces(const std::vector<PieceToJoin>& pieces, const JoinedVideo& output) {
  if (pieces.empty()) throw std::runtime_error(output.shownName + ": no pieces to join");
  Input first = openPiece(pieces.front().path);
  const AVCodecParameters& parameters =
      *first->streams[videoStreamOf(*first, pieces.front().path)]->codecpar;
  // Pieces are compared by what their headers say; the joined stream's parameters are completed
  // from the first piece's pictures, as some muxers need what only they tell (MP4's VP9 record
  // wants the profile and the sampling).
  const std::string parametersOfFirst = parametersText(parameters);
  const int result = avformat_find_stream_info(first.get(), nullptr);
  if (result < 0)
    throw PieceMismatch(0, pieces.front().path + ": cannot be read (" + avErrorText(result) + ")");
  JoinedFile joined(output, parameters);
  first.reset();
  int64_t lastDecode = std::numeric_limits<int64_t>::min();
  for (std::size_t i = 0; i < pieces.size(); ++i)
    copyPiece(i, pieces[i], parametersOfFirst, joined, lastDecode);
  joined.finish();
}

}  // namespace refhost
