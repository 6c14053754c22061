// The modal dialogs of the viewer.
#include "viewer/viewer_dialogs.h"

#include <imgui.h>

namespace veltrane_viewer {
namespace {

const ImVec4 kProblemText{1.0f, 0.45f, 0.4f, 1.0f};

// Opens the named modal on the frame the flag is first seen, centred; false while it is shut.
bool beginModal(const char* name, bool open) {
  if (open && !ImGui::IsPopupOpen(name)) {
    ImGui::OpenPopup(name);
    ImGui::SetNextWindowPos(ImGui::GetMainViewport()->GetCenter(), ImGuiCond_Always,
                            ImVec2(0.5f, 0.5f));
  }
  return ImGui::BeginPopupModal(name, nullptr, ImGuiWindowFlags_AlwaysAutoResize);
}

// Ends the modal, closing it once the window has shut its dialog (or on a Cancel).
DialogAnswer ending(DialogAnswer answer, bool open) {
  if (!open || answer == DialogAnswer::Cancel) ImGui::CloseCurrentPopup();
  ImGui::EndPopup();
  return answer;
}

void showProblem(const std::string& problem) {
  if (problem.empty()) return;
  ImGui::PushStyleColor(ImGuiCol_Text, kProblemText);
  ImGui::PushTextWrapPos(ImGui::GetFontSize() * 36);
  ImGui::TextUnformatted(problem.c_str());
  ImGui::PopTextWrapPos();
  ImGui::PopStyleColor();
}

// A path field that has the keyboard when its dialog appears; typing replaces the text offered.
void pathField(const char* prompt, char* text, std::size_t size) {
  ImGui::TextUnformatted(prompt);
  if (ImGui::IsWindowAppearing()) ImGui::SetKeyboardFocusHere();
  ImGui::SetNextItemWidth(ImGui::GetFontSize() * 30);
  ImGui::InputText("##path", text, size, ImGuiInputTextFlags_AutoSelectAll);
}

// The buttons that end a dialog: the one that accepts it, then Cancel.
DialogAnswer acceptOrCancel(const char* accept) {
  DialogAnswer answer = DialogAnswer::None;
  if (ImGui::Button(accept)) answer = DialogAnswer::Accept;
  ImGui::SameLine();
  if (ImGui::Button("Cancel")) answer = DialogAnswer::Cancel;
  return answer;
}

}  // namespace

const std::array<const char*, 7>& renderCodecChoices() {
  static const std::array<const char*, 7> choices{
      "(the output's own)", "h264", "h265", "prores", "ffv1", "vp9", "av1"};
  return choices;
}

DialogAnswer drawUnsavedPrompt(UnsavedPrompt& prompt) {
  if (!beginModal("Unsaved changes", prompt.open)) return DialogAnswer::None;
  ImGui::Text("Save the changes to %s before closing?", prompt.document.c_str());
  ImGui::Spacing();
  DialogAnswer answer = DialogAnswer::None;
  if (ImGui::Button("Save (S)")) answer = DialogAnswer::Accept;
  ImGui::SameLine();
  if (ImGui::Button("Discard (D)")) answer = DialogAnswer::Discard;
  ImGui::SameLine();
  if (ImGui::Button("Cancel (Esc)")) answer = DialogAnswer::Cancel;
  return ending(answer, prompt.open);
}

DialogAnswer drawSaveAs(SaveAsDialog& dialog) {
  if (!beginModal("Save As", dialog.open)) return DialogAnswer::None;
  DialogAnswer answer = DialogAnswer::None;
  if (dialog.confirmingReplace) {
    ImGui::Text("%s is there already. Replace it?", dialog.path.data());
    answer = acceptOrCancel("Replace");
    if (answer == DialogAnswer::Cancel) {  // back to the path, the dialog stays
      dialog.confirmingReplace = false;
      answer = DialogAnswer::None;
    }
  } else {
    pathField("Save the scene as:", dialog.path.data(), dialog.path.size());
    showProblem(dialog.problem);
    answer = acceptOrCancel("Save");
  }
  // The window decides whether an Accept closes the dialog (it may ask to replace first).
  return ending(answer, dialog.open);
}

DialogAnswer drawRenderDialog(RenderDialog& dialog) {
  if (!beginModal("Render", dialog.open)) return DialogAnswer::None;
  const float narrow = ImGui::GetFontSize() * 7;
  pathField("Render the scene as it is now to:", dialog.output.data(), dialog.output.size());
  ImGui::TextDisabled("a video (.mp4 .mov .mkv .webm), a still (.png .exr) or frames (f%%04d.png)");
  ImGui::SetNextItemWidth(narrow);
  ImGui::InputText("from", dialog.from.data(), dialog.from.size());
  ImGui::SameLine();
  ImGui::SetNextItemWidth(narrow);
  ImGui::InputText("to (seconds or 00:00:01.5; empty: the whole scene)", dialog.to.data(),
                   dialog.to.size());
  ImGui::SetNextItemWidth(narrow * 2);
  const auto& codecs = renderCodecChoices();
  ImGui::Combo("codec", &dialog.codec, codecs.data(), static_cast<int>(codecs.size()));
  ImGui::Checkbox("replace a file that is there", &dialog.replace);
  showProblem(dialog.problem);
  return ending(acceptOrCancel("Render"), dialog.open);
}

}  // namespace veltrane_viewer
