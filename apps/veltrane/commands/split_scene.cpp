// Building the scene of a split from its clips.
#include "commands/split_scene.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <sstream>

#include "cli/cli_support.h"
#include "refhost/gl/headless_context.h"
#include "refhost/media/media_source.h"
#include "refhost/media/test_patterns.h"

namespace veltrane_cli {
namespace {

constexpr int32_t kMaxClips = 9;
// Generated pictures and stills have no size or rate of their own.
constexpr std::array<int32_t, 2> kDefaultSize{1920, 1080};
constexpr refhost::FrameRate kDefaultRate{25, 1};

std::string layerGuid(std::size_t clip) {
  char text[48];  // room for any size_t
  std::snprintf(text, sizeof text, "5b1170e0-0000-4000-8000-%012zu", clip);
  return text;
}

std::vector<std::string> splitAt(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::stringstream stream(text);
  for (std::string part; std::getline(stream, part, separator);) parts.push_back(part);
  if (!text.empty() && text.back() == separator) parts.push_back("");
  return parts;
}

std::optional<std::array<double, 3>> hexColour(std::string text) {
  if (!text.empty() && text[0] == '#') text.erase(0, 1);
  const std::pair<const char*, const char*> named[] = {
      {"black", "000000"}, {"white", "ffffff"}, {"grey", "808080"}, {"gray", "808080"},
      {"red", "ff0000"},   {"green", "00ff00"}, {"blue", "0000ff"}, {"yellow", "ffff00"}};
  for (const auto& [name, hex] : named)
    if (text == name) text = hex;
  if (text.size() != 6 || text.find_first_not_of("0123456789abcdefABCDEF") != std::string::npos)
    return std::nullopt;
  std::array<double, 3> colour{};
  for (int c = 0; c < 3; ++c)
    colour[c] = std::stoi(text.substr(static_cast<std::size_t>(2 * c), 2), nullptr, 16) / 255.0;
  return colour;
}

// A clip as a scene source, opened once to prove it shows a picture and to learn what it is.
struct Clip {
  nlohmann::ordered_json source;
  refhost::MediaInfo info;
  bool video = false;
  std::string name;   // its layer's: the file's stem, a pattern's name, a colour
  std::string shown;  // as messages name it: the file's name, or the argument
};

Clip readClip(const std::string& argument) {
  const std::string shown = "argument '" + argument + "'";
  Clip clip;
  clip.shown = argument;
  refhost::MediaSpec spec;
  if (argument.rfind("pattern:", 0) == 0) {
    const std::string name = argument.substr(8);
    auto pattern = refhost::patternFromName(name);
    if (!pattern)
      throw UsageError(shown +
                       ": expected pattern:bars, pattern:checker, pattern:gradient or "
                       "pattern:counter");
    clip.source = {{"pattern", name}};
    clip.name = name;
    return clip;
  }
  if (argument.rfind("color:", 0) == 0) {
    auto colour = hexColour(argument.substr(6));
    if (!colour) throw UsageError(shown + ": expected color:RRGGBB (hexadecimal) or a colour name");
    clip.source = {{"color", {(*colour)[0], (*colour)[1], (*colour)[2]}}};
    clip.name = argument.substr(6);
    return clip;
  }
  std::error_code error;
  const auto status = std::filesystem::status(argument, error);
  if (status.type() == std::filesystem::file_type::not_found)
    throw UsageError(shown + ": expected a video or image file, and there is no such file");
  if (std::filesystem::is_directory(status))
    throw UsageError(shown + ": expected a video or image file, got a folder");
  try {
    clip.info =
        refhost::openMediaSource(refhost::MediaSpec::ofFile(argument), kDefaultRate)->info();
  } catch (const std::exception& failure) {
    std::string why = failure.what();
    // The reader names the file already; the argument says it again.
    if (why.rfind(argument + ": ", 0) == 0) why.erase(0, argument.size() + 2);
    throw UsageError(shown + ": expected a video or image file that shows a picture (" + why + ")");
  }
  clip.video = clip.info.video;
  clip.source = {{"file", argument}, {"fit", "contain"}};
  clip.name = std::filesystem::path(argument).stem().string();
  clip.shown = std::filesystem::path(argument).filename().string();
  return clip;
}

int32_t framesOf(const Clip& clip, refhost::FrameRate rate) {
  if (!clip.video || !(clip.info.duration > 0)) return 0;
  return std::max(1, static_cast<int32_t>(std::ceil(clip.info.duration * rate.perSecond() - 1e-6)));
}

// The composition's rate: the one asked for, else the first video's nominal rate, else 25; a
// first clip without a rate of its own (a still, a generated picture) says which it took.
refhost::FrameRate chooseRate(const SplitRequest& request, const std::vector<Clip>& clips,
                              std::vector<std::string>& notes) {
  if (request.fps) return *request.fps;
  const auto video = std::find_if(clips.begin(), clips.end(), [](const Clip& clip) {
    return clip.video && clip.info.frameRate.valid();
  });
  if (video == clips.begin()) return video->info.frameRate;
  const std::string first = "clip 1 (" + clips.front().shown + ") is " +
                            (clips.front().info.width > 0 ? "a still" : "generated");
  if (video == clips.end()) {
    notes.push_back(first + " and no clip is a video: the frames run at " + kDefaultRate.text() +
                    " fps; --fps R sets another rate");
    return kDefaultRate;
  }
  notes.push_back(first + ": the frames run at " + video->info.frameRate.text() +
                  " fps, the rate of clip " + std::to_string(video - clips.begin() + 1) + " (" +
                  video->shown + "); --fps R sets another rate");
  return video->info.frameRate;
}

// A rate as a scene writes it: a whole number, or the exact fraction as text.
nlohmann::ordered_json rateJson(refhost::FrameRate rate) {
  if (reduced(rate).denominator == 1) return reduced(rate).numerator;
  return rate.text();
}

// A parameter value as a scene file writes it, in the shape its declared kind has.
nlohmann::ordered_json valueJson(const refhost::Param& declared, const refhost::ParamValue& value) {
  auto number = [](double v) { return std::round(v * 1e4) / 1e4; };  // no float noise in files
  switch (declared.kind) {
    case refhost::ParamKind::Layer:
      return std::string(value.layer);
    case refhost::ParamKind::Int:
    case refhost::ParamKind::Bool:
    case refhost::ParamKind::Choice:
      return value.integer;
    case refhost::ParamKind::Point:
      return {number(value.number[0]), number(value.number[1])};
    case refhost::ParamKind::Color:
      return {number(value.number[0]), number(value.number[1]), number(value.number[2])};
    default:
      return number(value.number[0]);
  }
}

std::vector<Clip> readClips(const SplitRequest& request) {
  if (request.clips.empty()) throw UsageError("expects 1 to 9 clips, got none");
  if (request.clips.size() > static_cast<std::size_t>(kMaxClips))
    throw UsageError("expects 1 to 9 clips, got " + std::to_string(request.clips.size()));
  std::vector<Clip> clips;
  for (const std::string& argument : request.clips) clips.push_back(readClip(argument));
  return clips;
}

// The layout named (or the one for the number of clips), checked against the clips and the
// nudges.
std::size_t chooseLayout(const SplitRequest& request, std::size_t clips) {
  const std::string name = request.layout.value_or(defaultLayoutFor(static_cast<int32_t>(clips)));
  const std::optional<std::size_t> layout = findLayout(name);
  if (!layout)
    throw UsageError("option '--layout': expected one of " + layoutNames() + ", got '" + name +
                     "'");
  const LayoutInfo& info = layouts()[*layout];
  if (static_cast<int32_t>(clips) > info.regions)
    throw UsageError("option '--layout': " + name + " shows " + std::to_string(info.regions) +
                     " pictures, fewer than the " + std::to_string(clips) + " clips given");
  for (const FrameNudge& nudge : request.nudges)
    if (nudge.input < 1 || nudge.input > static_cast<int32_t>(clips))
      throw UsageError("option '--frame': expected a clip number from 1 to " +
                       std::to_string(clips) + ", got " + std::to_string(nudge.input));
  return *layout;
}

struct Frame {
  std::array<int32_t, 2> size = kDefaultSize;
  refhost::FrameRate rate = kDefaultRate;
  int32_t duration = 1;
};

// The composition's size and rate from the first clip (or the options), its length from the
// clips the request's length rule names.
Frame compositionOf(const SplitRequest& request, const std::vector<Clip>& clips,
                    std::vector<std::string>& notes) {
  Frame frame;
  const Clip& first = clips.front();
  if (first.info.width > 0 && first.info.height > 0)
    frame.size = {first.info.width, first.info.height};
  if (request.size) frame.size = *request.size;
  frame.rate = chooseRate(request, clips, notes);
  // Stills and generated pictures have no length: they last as long as the composition. A
  // first clip without one leaves the length to the longest video.
  int32_t longest = 0, shortest = 0;
  for (const Clip& clip : clips) {
    const int32_t frames = framesOf(clip, frame.rate);
    if (frames == 0) continue;
    longest = std::max(longest, frames);
    shortest = shortest == 0 ? frames : std::min(shortest, frames);
  }
  frame.duration = request.length == SplitRequest::Length::Longest    ? longest
                   : request.length == SplitRequest::Length::Shortest ? shortest
                                                                      : framesOf(first, frame.rate);
  if (frame.duration == 0) frame.duration = longest;
  frame.duration = std::max(frame.duration, 1);  // stills and generated pictures alone: one frame
  return frame;
}

LayoutPlan planFor(const SplitRequest& request, std::size_t layout, const Frame& frame) {
  try {
    return planLayout(layout, frame.size[0], frame.size[1], request.layoutOptions);
  } catch (const std::invalid_argument& refusal) {
    const char* option = request.layoutOptions.gap ? "--gap" : "--radial-centre";
    throw UsageError(std::string("option '") + option + "': " + refusal.what());
  }
}

// The engine the layout's regions are asked of: the module at the composition's size, with no
// media (the regions need none).
std::unique_ptr<refhost::Engine> regionEngine(const std::string& modulePath, const Frame& frame) {
  refhost::EngineOptions options;
  options.modulePath = modulePath;
  options.makeContext = refhost::makeHeadlessContext;
  auto engine = std::make_unique<refhost::Engine>(std::move(options));
  refhost::FrameSettings settings;
  settings.width = frame.size[0];
  settings.height = frame.size[1];
  settings.frameRate = frame.rate.perSecond();
  engine->setFrameSettings(settings);
  engine->start();
  engine->createInstance();
  return engine;
}

// The values the layout sets, less those at their declared defaults (an unused cut, an input at
// the frame's placement), so that the saved scene reads as a person's; the cut type by name.
nlohmann::ordered_json layoutParams(refhost::Engine& engine, const LayoutPlan& plan,
                                    const std::vector<std::string>& sources,
                                    const std::vector<Point>& pictureSizes) {
  const refhost::EffectVocabulary& roles = engine.vocabulary();
  const refhost::Param& cutType = roles.declared(refhost::EffectParam::CutType);
  nlohmann::ordered_json params = nlohmann::ordered_json::object();
  for (const ParamEdit& edit : layoutEdits(engine, plan, sources, pictureSizes)) {
    const refhost::Param& declared = roles.declared(edit.id);
    if (edit.id == cutType.id) {
      params[edit.id] = cutType.choices.at(static_cast<std::size_t>(edit.value.integer));
      continue;
    }
    nlohmann::ordered_json value = valueJson(declared, edit.value);
    if (value != valueJson(declared, declared.defaultValue)) params[edit.id] = value;
  }
  return params;
}

// Each nudge moves, scales and turns the framing of every input that shows its clip.
void applyNudges(nlohmann::ordered_json& params, const std::vector<FrameNudge>& nudges,
                 const LayoutPlan& plan, std::size_t clips,
                 const refhost::EffectVocabulary& roles) {
  using refhost::InputParam;
  for (const FrameNudge& nudge : nudges) {
    for (std::size_t k = 0; k < plan.inputs.size(); ++k) {
      if (k % clips != static_cast<std::size_t>(nudge.input - 1)) continue;
      const int32_t input = plan.inputs[k];
      const std::string& translation = roles.id(InputParam::Translation, input);
      const std::string& scale = roles.id(InputParam::Scale, input);
      const refhost::ParamValue translationDefault =
          roles.declared(InputParam::Translation, input).defaultValue;
      const Point at =
          params.contains(translation)
              ? Point{params[translation][0].get<double>(), params[translation][1].get<double>()}
              : Point{translationDefault.number[0], translationDefault.number[1]};
      params[translation] = {at[0] + nudge.offset[0], at[1] + nudge.offset[1]};
      const double framed = params.contains(scale)
                                ? params[scale].get<double>()
                                : roles.declared(InputParam::Scale, input).defaultValue.number[0];
      params[scale] = framed * nudge.scale / 100;
      if (nudge.rotation != 0) params[roles.id(InputParam::Rotation, input)] = nudge.rotation;
    }
  }
}

void applyBorder(nlohmann::ordered_json& params, const BorderSetting& border,
                 const refhost::EffectVocabulary& roles) {
  using refhost::EffectParam;
  params[roles.id(EffectParam::BorderWidth)] = border.width;
  params[roles.id(EffectParam::BorderColor)] = {border.colour[0], border.colour[1],
                                                border.colour[2]};
  params[roles.id(EffectParam::BorderAlpha)] = border.opacity;
}

}  // namespace

SplitScene buildSplitScene(const SplitRequest& request, const std::string& modulePath) {
  const std::vector<Clip> clips = readClips(request);
  const std::size_t layout = chooseLayout(request, clips.size());
  const LayoutInfo& info = layouts()[layout];
  SplitScene split;
  const Frame frame = compositionOf(request, clips, split.notes);
  const LayoutPlan plan = planFor(request, layout, frame);

  if (static_cast<int32_t>(clips.size()) < info.regions)
    split.notes.push_back(std::string(info.name) + " shows " + std::to_string(info.regions) +
                          " pictures; the " + std::to_string(clips.size()) + " clip" +
                          (clips.size() == 1 ? "" : "s") + " given fill them again in order");

  std::vector<std::string> sources{refhost::kNoLayer};
  std::vector<Point> pictureSizes;
  nlohmann::ordered_json layers = nlohmann::ordered_json::array();
  for (std::size_t i = 0; i < clips.size(); ++i) {
    const Clip& clip = clips[i];
    // A clip keeps its proportions: its picture's content at scale 100 is the largest of its
    // shape inside the frame.
    pictureSizes.push_back(
        contentSize(clip.info.width, clip.info.height, true, frame.size[0], frame.size[1]));
    if (i == 0) continue;
    sources.push_back(layerGuid(i));
    layers.push_back({{"guid", layerGuid(i)}, {"name", clip.name}, {"source", clip.source}});
    if (clip.video || clip.info.width == 0) layers.back()["frameCount"] = frame.duration;
  }

  std::unique_ptr<refhost::Engine> engine = regionEngine(modulePath, frame);
  nlohmann::ordered_json params = layoutParams(*engine, plan, sources, pictureSizes);
  applyNudges(params, request.nudges, plan, clips.size(), engine->vocabulary());
  if (request.border) applyBorder(params, *request.border, engine->vocabulary());

  split.document = {{"description", "veltrane split of " + std::to_string(clips.size()) + " clip" +
                                        (clips.size() == 1 ? "" : "s") + ", layout " + info.name},
                    {"width", frame.size[0]},
                    {"height", frame.size[1]},
                    {"fps", rateJson(frame.rate)},
                    {"duration", frame.duration},
                    {"source", clips.front().source},
                    {"layers", layers},
                    {"params", params}};
  return split;
}

std::array<int32_t, 2> parseFrameSize(const std::string& option, const std::string& text) {
  const std::string::size_type x = text.find('x');
  const std::string expected = "option '" + option + "' expects WIDTHxHEIGHT from 2x2 to " +
                               "16384x16384 (e.g. 1920x1080), got '" + text + "'";
  if (x == std::string::npos) throw UsageError(expected);
  std::array<int32_t, 2> size{};
  try {
    size = {parseInt32(option, text.substr(0, x)), parseInt32(option, text.substr(x + 1))};
  } catch (const UsageError&) {
    throw UsageError(expected);
  }
  if (size[0] < 2 || size[1] < 2 || size[0] > 16384 || size[1] > 16384) throw UsageError(expected);
  return size;
}

double parseNumber(const std::string& option, const std::string& text) {
  std::size_t used = 0;
  double value = 0;
  try {
    value = std::stod(text, &used);
  } catch (const std::exception&) {
    used = 0;
  }
  if (used == 0 || used != text.size() || !std::isfinite(value))
    throw UsageError("option '" + option + "' expects a number, got '" + text + "'");
  return value;
}

refhost::FrameRate parseFrameRate(const std::string& option, const std::string& text) {
  const std::optional<refhost::FrameRate> rate = refhost::frameRateFromText(text);
  if (!rate || rate->perSecond() < 0.001 || rate->perSecond() > 1000)
    throw UsageError("option '" + option +
                     "' expects a rate from 0.001 to 1000: a whole number, a decimal or a "
                     "fraction (30, 29.97, 30000/1001), got '" +
                     text + "'");
  return *rate;
}

Point parsePoint(const std::string& option, const std::string& text) {
  const std::vector<std::string> parts = splitAt(text, ',');
  if (parts.size() != 2)
    throw UsageError("option '" + option +
                     "' expects X,Y (pixels from the frame's centre, y up), "
                     "got '" +
                     text + "'");
  return {parseNumber(option, parts[0]), parseNumber(option, parts[1])};
}

BorderSetting parseBorder(const std::string& option, const std::string& text) {
  const std::vector<std::string> parts = splitAt(text, ',');
  if (parts.empty() || parts.size() > 3)
    throw UsageError("option '" + option + "' expects WIDTH[,COLOUR[,OPACITY]], got '" + text +
                     "'");
  BorderSetting border;
  border.width = parseNumber(option, parts[0]);
  if (border.width < 0 || border.width > 200)
    throw UsageError("option '" + option + "' expects a width from 0 to 200 pixels, got '" +
                     parts[0] + "'");
  border.colour = {1, 1, 1};
  if (parts.size() > 1) {
    auto colour = hexColour(parts[1]);
    if (!colour)
      throw UsageError("option '" + option +
                       "' expects a colour as RRGGBB or a name (black, "
                       "white, grey, red, green, blue, yellow), got '" +
                       parts[1] + "'");
    border.colour = *colour;
  }
  if (parts.size() > 2) {
    border.opacity = parseNumber(option, parts[2]);
    if (border.opacity < 0 || border.opacity > 1)
      throw UsageError("option '" + option + "' expects an opacity from 0 to 1, got '" + parts[2] +
                       "'");
  }
  return border;
}

FrameNudge parseNudge(const std::string& option, const std::string& text) {
  const std::string expected = "option '" + option + "' expects N:X,Y[,SCALE[,ROTATION]] (clip " +
                               "N from 1, offset in pixels, scale in percent, degrees), got '" +
                               text + "'";
  const std::string::size_type colon = text.find(':');
  if (colon == std::string::npos) throw UsageError(expected);
  const std::vector<std::string> parts = splitAt(text.substr(colon + 1), ',');
  if (parts.size() < 2 || parts.size() > 4) throw UsageError(expected);
  FrameNudge nudge;
  nudge.input = parseInt32(option, text.substr(0, colon));
  nudge.offset = {parseNumber(option, parts[0]), parseNumber(option, parts[1])};
  if (parts.size() > 2) nudge.scale = parseNumber(option, parts[2]);
  if (parts.size() > 3) nudge.rotation = parseNumber(option, parts[3]);
  if (!(nudge.scale > 0) || nudge.scale > 10000)
    throw UsageError("option '" + option + "' expects a scale above 0 and up to 10000 percent");
  return nudge;
}

const std::vector<OptionDefinition> kSplitOptions = {
    {"--layout", true}, {"--size", true}, {"--fps", true},           {"--duration", true},
    {"--angle", true},  {"--gap", true},  {"--radial-centre", true}, {"--border", true}};

SplitRequest splitRequestFrom(const std::vector<std::string>& clips,
                              const std::map<std::string, std::string>& options) {
  SplitRequest request;
  request.clips = clips;
  auto given = [&](const char* name) -> const std::string* {
    auto found = options.find(name);
    return found == options.end() ? nullptr : &found->second;
  };
  if (auto* text = given("--layout")) request.layout = *text;
  if (auto* text = given("--size")) request.size = parseFrameSize("--size", *text);
  if (auto* text = given("--fps")) request.fps = parseFrameRate("--fps", *text);
  if (auto* text = given("--duration")) request.length = parseLength("--duration", *text);
  if (auto* text = given("--angle")) request.layoutOptions.angle = parseNumber("--angle", *text);
  if (auto* text = given("--gap")) request.layoutOptions.gap = parseNumber("--gap", *text);
  if (auto* text = given("--radial-centre"))
    request.layoutOptions.radialCentre = parsePoint("--radial-centre", *text);
  if (auto* text = given("--border")) request.border = parseBorder("--border", *text);
  if (auto* text = given("--frame"))
    for (const std::string& one : splitAt(*text, ';'))
      if (one.find(':') != std::string::npos) request.nudges.push_back(parseNudge("--frame", one));
  return request;
}

SplitRequest::Length parseLength(const std::string& option, const std::string& text) {
  if (text == "first") return SplitRequest::Length::First;
  if (text == "longest") return SplitRequest::Length::Longest;
  if (text == "shortest") return SplitRequest::Length::Shortest;
  throw UsageError("option '" + option + "' expects first, longest or shortest, got '" + text +
                   "'");
}

}  // namespace veltrane_cli
