// The editors' layout pick, planned and framed by the layouts `veltrane split` uses.
#include "layout_choice.h"

#include <cctype>
#include <cmath>

#include "layouts/layouts.h"

namespace veltrane_mlt {

const char* const kLayoutProperty = "layout";
const char* const kLayoutAngleProperty = "layout_angle";
const char* const kFramePicturesProperty = "frame_pictures";

namespace {

// The frame sizes kept apart in the framing cache before it is cleared: an editor's preview
// and its full render, with room for a few layouts and angles each.
constexpr std::size_t kMostFramings = 64;

std::string trimmed(const char* text) {
  std::string out = text ? text : "";
  while (!out.empty() && std::isspace(static_cast<unsigned char>(out.back()))) out.pop_back();
  std::size_t start = 0;
  while (start < out.size() && std::isspace(static_cast<unsigned char>(out[start]))) ++start;
  return out.substr(start);
}

std::size_t indexOf(const refhost::ParamPanel& panel, const std::string& id) {
  const refhost::Param* param = panel.find(std::string_view(id));
  if (!param) throw std::out_of_range("the module declares no " + id);
  return static_cast<std::size_t>(param - &panel.params()[0]);
}

bool isFraming(const refhost::EffectVocabulary& roles, const std::string& id) {
  auto input = roles.inputOf(id);
  return input && (input->first == refhost::InputParam::Translation ||
                   input->first == refhost::InputParam::Scale ||
                   input->first == refhost::InputParam::Rotation);
}

}  // namespace

LayoutChoice readLayoutChoice(mlt_properties properties, int position, int length,
                              std::string* problem) {
  LayoutChoice choice;
  const std::string name =
      trimmed(mlt_properties_anim_get(properties, kLayoutProperty, position, length));
  if (!name.empty() && name != "none") {
    choice.layout = veltrane_cli::findLayout(name);
    if (!choice.layout && problem)
      *problem =
          "\"" + name + "\" is no layout: expected none or one of " + veltrane_cli::layoutNames();
  }
  if (mlt_properties_get(properties, kLayoutAngleProperty))
    choice.angle =
        mlt_properties_anim_get_double(properties, kLayoutAngleProperty, position, length);
  if (!std::isfinite(choice.angle)) choice.angle = 0;
  choice.framePictures = mlt_properties_get_int(properties, kFramePicturesProperty) != 0;
  return choice;
}

void LayoutApplier::apply(refhost::Engine& engine, const LayoutChoice& choice,
                          std::vector<refhost::ParamValue>& values) {
  if (!choice.layout) return;
  const refhost::FrameSettings& frame = engine.frameSettings();
  veltrane_cli::LayoutOptions options;
  options.angle = choice.angle;
  const veltrane_cli::LayoutPlan plan =
      veltrane_cli::planLayout(*choice.layout, frame.width, frame.height, options);
  const refhost::EffectVocabulary& roles = engine.vocabulary();
  const refhost::ParamPanel& panel = engine.panel();
  for (const veltrane_cli::ParamEdit& edit : veltrane_cli::cutEdits(plan, roles))
    values.at(indexOf(panel, edit.id)) = edit.value;
  if (!choice.framePictures) return;

  const Key key{*choice.layout, choice.angle, frame.width, frame.height};
  auto found = framings_.find(key);
  if (found == framings_.end()) {
    if (framings_.size() >= kMostFramings) framings_.clear();
    // The layout's own edits give every input it shows a source; only their framing is kept
    // (the layers are the properties'), and every picture fills the frame as MLT hands it.
    std::vector<std::pair<std::string, refhost::ParamValue>> framing;
    for (const veltrane_cli::ParamEdit& edit :
         veltrane_cli::layoutEdits(engine, plan, {refhost::kNoLayer}))
      if (isFraming(roles, edit.id)) framing.emplace_back(edit.id, edit.value);
    found = framings_.emplace(key, std::move(framing)).first;
  }
  for (const auto& [id, value] : found->second) values.at(indexOf(panel, id)) = value;
}

}  // namespace veltrane_mlt
