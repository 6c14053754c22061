// Groups, widgets and keyframe toggles of the parameter panel.
#include "viewer/viewer_panel.h"

#include <imgui.h>

namespace veltrane_viewer {
namespace {

using refhost::Param;
using refhost::ParamKind;
using refhost::ParamPanel;
using refhost::ParamValue;

// Keyframes and animated values are drawn in amber, the colour editors use for them.
const ImVec4 kAnimatedText{1.0f, 0.78f, 0.3f, 1.0f};
const ImU32 kKeyColour = IM_COL32(255, 200, 77, 255);
const ImU32 kStaticColour = IM_COL32(110, 110, 110, 255);

bool groupInUse(const ParamPanel& panel, const refhost::ParamGroup& group) {
  for (const refhost::PanelItem& item : group.items) {
    if (item.isGroup ? groupInUse(panel, panel.groups()[static_cast<std::size_t>(item.index)])
                     : panel.params()[static_cast<std::size_t>(item.index)].enabled)
      return true;
  }
  return false;
}

// A diamond: filled where a key sits at the current frame, outlined on an animated parameter
// elsewhere, grey on a static one. A click toggles the key.
bool keyToggle(KeyState state, int32_t frame) {
  float size = ImGui::GetFrameHeight();
  ImVec2 corner = ImGui::GetCursorScreenPos();
  bool clicked = ImGui::InvisibleButton("key", ImVec2(size, size));
  ImVec2 c{corner.x + size / 2, corner.y + size / 2};
  float r = size * 0.28f;
  ImVec2 top{c.x, c.y - r}, right{c.x + r, c.y}, bottom{c.x, c.y + r}, left{c.x - r, c.y};
  ImDrawList* draw = ImGui::GetWindowDrawList();
  if (state == KeyState::KeyHere)
    draw->AddQuadFilled(top, right, bottom, left, kKeyColour);
  else
    draw->AddQuad(top, right, bottom, left,
                  state == KeyState::Animated ? kKeyColour : kStaticColour, 1.5f);
  if (ImGui::IsItemHovered())
    ImGui::SetTooltip(
        state == KeyState::KeyHere ? "Remove the key at frame %d" : "Add a key at frame %d", frame);
  return clicked;
}

void layerCombo(ViewerSession& session, const Param& param, const ParamValue& value,
                const std::vector<LayerOption>& layers, const char* label) {
  int chosen = layerOptionIndex(layers, value.layer);
  const char* shown =
      chosen >= 0 ? layers[static_cast<std::size_t>(chosen)].label.c_str() : value.layer.c_str();
  if (!ImGui::BeginCombo(label, shown)) return;
  for (std::size_t i = 0; i < layers.size(); ++i) {
    if (ImGui::Selectable(layers[i].label.c_str(), static_cast<int>(i) == chosen)) {
      session.editValue(param.id, ParamValue::ofLayer(layers[i].guid));
      session.finishEdit();
    }
  }
  ImGui::EndCombo();
}

// The widget of one parameter; an edit goes to the session while the widget is active and
// becomes one undo step when it lets go.
void valueWidget(ViewerSession& session, const Param& param, const ParamValue& value,
                 const std::vector<LayerOption>& layers, const char* label) {
  NumberWidget number = numberWidget(param);
  const char* format = number.format.c_str();
  auto edit = [&](const ParamValue& changed) { session.editValue(param.id, changed); };
  switch (widgetFor(param)) {
    case Widget::Slider:
    case Widget::Drag: {
      bool slider = number.widget == Widget::Slider;
      if (param.kind == ParamKind::Int) {
        int v = value.integer;
        int low = static_cast<int>(number.minimum), high = static_cast<int>(number.maximum);
        bool changed =
            slider ? ImGui::SliderInt(label, &v, low, high, format, ImGuiSliderFlags_AlwaysClamp)
                   : ImGui::DragInt(label, &v, static_cast<float>(number.dragSpeed), low, high,
                                    format, ImGuiSliderFlags_AlwaysClamp);
        if (changed) edit(ParamValue::ofInt(static_cast<int32_t>(clampToRange(param, v))));
      } else {
        float v = value.number[0];
        float low = static_cast<float>(number.minimum), high = static_cast<float>(number.maximum);
        bool changed =
            slider ? ImGui::SliderFloat(label, &v, low, high, format, ImGuiSliderFlags_AlwaysClamp)
                   : ImGui::DragFloat(label, &v, static_cast<float>(number.dragSpeed), low, high,
                                      format, ImGuiSliderFlags_AlwaysClamp);
        if (changed) edit(ParamValue::ofFloat(static_cast<float>(clampToRange(param, v))));
      }
      break;
    }
    case Widget::Checkbox: {
      bool on = value.integer != 0;
      if (ImGui::Checkbox(label, &on)) {
        edit(ParamValue::ofInt(on ? 1 : 0));
        session.finishEdit();
      }
      break;
    }
    case Widget::Choice: {
      int index = validChoice(param, value.integer);
      if (ImGui::BeginCombo(label, param.choices.empty() ? "" : param.choices[index].c_str())) {
        for (std::size_t i = 0; i < param.choices.size(); ++i) {
          if (ImGui::Selectable(param.choices[i].c_str(), static_cast<int>(i) == index)) {
            edit(ParamValue::ofInt(static_cast<int32_t>(i)));
            session.finishEdit();
          }
        }
        ImGui::EndCombo();
      }
      break;
    }
    case Widget::Colour: {
      float rgb[3] = {value.number[0], value.number[1], value.number[2]};
      if (ImGui::ColorEdit3(label, rgb, ImGuiColorEditFlags_Float))
        edit(ParamValue::ofColor(rgb[0], rgb[1], rgb[2]));
      break;
    }
    case Widget::Point: {
      float xy[2] = {value.number[0], value.number[1]};
      if (ImGui::DragFloat2(label, xy, static_cast<float>(number.dragSpeed), 0, 0, format))
        edit(ParamValue::ofPoint(xy[0], xy[1]));
      break;
    }
    case Widget::Angle: {
      float degrees = value.number[0];
      if (ImGui::DragFloat(label, &degrees, static_cast<float>(number.dragSpeed), 0, 0, format))
        edit(ParamValue::ofFloat(degrees));
      break;
    }
    case Widget::Layer:
      layerCombo(session, param, value, layers, label);
      break;
  }
  if (ImGui::IsItemDeactivated()) session.finishEdit();
}

void drawParam(ViewerSession& session, const Param& param, const std::vector<LayerOption>& layers) {
  ImGui::PushID(param.id.c_str());
  int32_t frame = session.frame();
  KeyState state = keyState(param, frame);
  // Disabled as the plug-in set it: greyed, still showing its value, its keys untouchable.
  ImGui::BeginDisabled(!param.enabled);
  if (keyToggle(state, frame)) session.toggleKey(param.id);
  ImGui::SameLine();
  if (state != KeyState::Static) ImGui::PushStyleColor(ImGuiCol_Text, kAnimatedText);
  std::string label = param.displayName + "##value";
  valueWidget(session, param, param.valueAt(frame), layers, label.c_str());
  if (state != KeyState::Static) ImGui::PopStyleColor();
  ImGui::EndDisabled();
  ImGui::PopID();
}

void drawItems(ViewerSession& session, const std::vector<refhost::PanelItem>& items,
               const std::vector<LayerOption>& layers, bool topLevel) {
  const ParamPanel& panel = session.engine().panel();
  for (const refhost::PanelItem& item : items) {
    auto index = static_cast<std::size_t>(item.index);
    if (!item.isGroup) {
      drawParam(session, panel.params()[index], layers);
      continue;
    }
    const refhost::ParamGroup& group = panel.groups()[index];
    ImGui::PushID(item.index);
    // Groups holding a parameter in use start open; the others wait until they are needed.
    ImGui::SetNextItemOpen(groupInUse(panel, group), ImGuiCond_Once);
    if (topLevel) {
      if (ImGui::CollapsingHeader(group.displayName.c_str()))
        drawItems(session, group.items, layers, false);
    } else if (ImGui::TreeNode(group.displayName.c_str())) {
      drawItems(session, group.items, layers, false);
      ImGui::TreePop();
    }
    ImGui::PopID();
  }
}

}  // namespace

void drawParameterPanel(ViewerSession& session, const std::vector<LayerOption>& layers) {
  ImGui::PushItemWidth(ImGui::GetContentRegionAvail().x * 0.55f);
  drawItems(session, session.engine().panel().topLevel(), layers, true);
  ImGui::PopItemWidth();
}

}  // namespace veltrane_viewer
