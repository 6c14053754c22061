// The viewer's dialogs, each a Dear ImGui modal: the question asked before unsaved changes are
// closed (Save, Discard, Cancel), Save As, and the options of a render. They only report what
// the person chose; the window acts on it.
#pragma once

#include <array>
#include <string>

namespace veltrane_viewer {

enum class DialogAnswer { None, Accept, Discard, Cancel };

// Unsaved changes: Accept saves, Discard closes without saving, Cancel goes back.
struct UnsavedPrompt {
  bool open = false;
  std::string document;  // the file the changes would be saved to
};

// Save As: the path typed; Accept writes it. A path that holds a file other than the one being
// edited asks again before it is replaced.
struct SaveAsDialog {
  bool open = false;
  std::array<char, 1024> path{};
  bool confirmingReplace = false;
  std::string problem;  // why the last attempt was refused
};

// Render...: where to, which part, which codec, whether to replace a file there.
struct RenderDialog {
  bool open = false;
  std::array<char, 1024> output{};
  std::array<char, 32> from{};  // times as render's --from and --to take them; empty: all
  std::array<char, 32> to{};
  int codec = 0;  // an index into renderCodecChoices(); 0: the output's own default
  bool replace = false;
  std::string problem;  // why the last render could not start
};

// The codecs the dialog offers, the first meaning the container's default.
const std::array<const char*, 7>& renderCodecChoices();

// Each draws its dialog (opening it on the frame `open` became true) into the current ImGui
// frame and returns the choice made on this frame.
DialogAnswer drawUnsavedPrompt(UnsavedPrompt& prompt);
DialogAnswer drawSaveAs(SaveAsDialog& dialog);
DialogAnswer drawRenderDialog(RenderDialog& dialog);

// Puts a text into one of the dialogs' fields.
template <std::size_t N>
void setField(std::array<char, N>& field, const std::string& text) {
  field.fill('\0');
  text.copy(field.data(), N - 1);
}

}  // namespace veltrane_viewer
