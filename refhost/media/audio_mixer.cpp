// The filter graph of the sound: a buffer source per clip, the chain of filters as text, and
// the sink the encoder draws its frames from; clips fed in turn, the one furthest behind first.
#include "refhost/media/audio_mixer.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavfilter/avfilter.h>
#include <libavfilter/buffersink.h>
#include <libavfilter/buffersrc.h>
#include <libavutil/channel_layout.h>
#include <libavutil/samplefmt.h>
}

#include <stdexcept>
#include <string>

#include "refhost/media/ffmpeg_utilities.h"

namespace refhost {
namespace {

std::string layoutName(const AVChannelLayout& layout) {
  char name[128] = {};
  av_channel_layout_describe(&layout, name, sizeof name);
  return name;
}

}  // namespace

struct AudioMixer::Graph {
  std::vector<std::unique_ptr<AudioInput>> inputs;
  std::vector<AVFilterContext*> sources;
  std::vector<double> fed;  // seconds handed to each source; below 0 once it has ended
  AVFilterGraph* graph = nullptr;
  AVFilterContext* sink = nullptr;
  AVFrame* out = av_frame_alloc();

  ~Graph() {
    av_frame_free(&out);
    avfilter_graph_free(&graph);
  }

  void check(int result, const std::string& what) const {
    if (result < 0) inputs.front()->fail(what, result);
  }

  // The filters between the sources ([in0], [in1], ...) and the sink ([out]).
  static std::string chain(std::size_t clips, const AVCodecContext* encoder, int64_t total) {
    const std::string format = std::string("aformat=sample_fmts=") +
                               av_get_sample_fmt_name(encoder->sample_fmt) +
                               ":sample_rates=" + std::to_string(encoder->sample_rate) +
                               ":channel_layouts=" + layoutName(encoder->ch_layout);
    const std::string resample = "aresample=" + std::to_string(encoder->sample_rate);
    const std::string length =
        "apad=whole_len=" + std::to_string(total) + ",atrim=end_sample=" + std::to_string(total);
    if (clips == 1) return "[in0]" + resample + "," + format + "," + length + "[out]";
    std::string text, mixed;
    for (std::size_t i = 0; i < clips; ++i) {
      const std::string n = std::to_string(i);
      text += "[in" + n + "]" + resample +
              ",aformat=sample_fmts=fltp:channel_layouts=" + layoutName(encoder->ch_layout) + "[a" +
              n + "];";
      mixed += "[a" + n + "]";
    }
    return text + mixed + "amix=inputs=" + std::to_string(clips) +
           ":duration=longest:normalize=1," + length + "," + format + "[out]";
  }

  void build(const AVCodecContext* encoder, int64_t total) {
    graph = avfilter_graph_alloc();
    if (!graph || !out) throw std::bad_alloc();
    AVFilterInOut* outputs = nullptr;  // the sources' pads, which feed the chain
    for (std::size_t i = 0; i < inputs.size(); ++i) {
      const AVCodecContext* decoder = inputs[i]->decoder();
      const std::string arguments = "time_base=1/" + std::to_string(decoder->sample_rate) +
                                    ":sample_rate=" + std::to_string(decoder->sample_rate) +
                                    ":sample_fmt=" + av_get_sample_fmt_name(decoder->sample_fmt) +
                                    ":channel_layout=" + layoutName(decoder->ch_layout);
      AVFilterContext* source = nullptr;
      check(avfilter_graph_create_filter(&source, avfilter_get_by_name("abuffer"),
                                         ("in" + std::to_string(i)).c_str(), arguments.c_str(),
                                         nullptr, graph),
            "no filter for its sound");
      sources.push_back(source);
      AVFilterInOut* pad = avfilter_inout_alloc();
      if (!pad) throw std::bad_alloc();
      pad->name = av_strdup(("in" + std::to_string(i)).c_str());
      pad->filter_ctx = source;
      pad->pad_idx = 0;
      pad->next = outputs;
      outputs = pad;
    }
    check(avfilter_graph_create_filter(&sink, avfilter_get_by_name("abuffersink"), "out", nullptr,
                                       nullptr, graph),
          "no filter for its sound");
    AVFilterInOut* end = avfilter_inout_alloc();
    if (!end) throw std::bad_alloc();
    end->name = av_strdup("out");
    end->filter_ctx = sink;
    end->pad_idx = 0;
    end->next = nullptr;
    const std::string text = chain(inputs.size(), encoder, total);
    const int result = avfilter_graph_parse_ptr(graph, text.c_str(), &end, &outputs, nullptr);
    avfilter_inout_free(&end);
    avfilter_inout_free(&outputs);
    check(result, "the sound's filters refused");
    check(avfilter_graph_config(graph, nullptr), "the sound's filters refused");
    if (encoder->frame_size > 0 &&
        !(encoder->codec->capabilities & AV_CODEC_CAP_VARIABLE_FRAME_SIZE))
      av_buffersink_set_frame_size(sink, static_cast<unsigned>(encoder->frame_size));
    fed.assign(inputs.size(), 0);
  }

  // Hands the clip furthest behind its next samples, or its end; false when every clip ended.
  bool feed() {
    std::size_t behind = fed.size();
    for (std::size_t i = 0; i < fed.size(); ++i)
      if (fed[i] >= 0 && (behind == fed.size() || fed[i] < fed[behind])) behind = i;
    if (behind == fed.size()) return false;
    AVFrame* samples = inputs[behind]->nextSamples();
    if (!samples) {
      check(av_buffersrc_add_frame(sources[behind], nullptr), "the sound's filters failed");
      fed[behind] = -1;
      return true;
    }
    fed[behind] += static_cast<double>(samples->nb_samples) / samples->sample_rate;
    check(av_buffersrc_add_frame_flags(sources[behind], samples, AV_BUFFERSRC_FLAG_KEEP_REF),
          "the sound's filters failed");
    return true;
  }
};

AudioMixer::AudioMixer(std::vector<std::unique_ptr<AudioInput>> inputs,
                       const AVCodecContext* encoder, int64_t totalSamples)
    : graph_(std::make_unique<Graph>()) {
  graph_->inputs = std::move(inputs);
  graph_->build(encoder, totalSamples);
}

AudioMixer::~AudioMixer() = default;

AVFrame* AudioMixer::next() {
  Graph& g = *graph_;
  for (;;) {
    av_frame_unref(g.out);
    const int result = av_buffersink_get_frame(g.sink, g.out);
    if (result == 0) return g.out;
    if (result == AVERROR_EOF) return nullptr;
    if (result != AVERROR(EAGAIN)) g.check(result, "the sound's filters failed");
    if (!g.feed()) return nullptr;
  }
}

}  // namespace refhost
