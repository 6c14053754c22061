// A scene running in the plug-in as a host's viewer drives it: pointer and key events become
// pointer and key messages in the frame's corner space, every parameter change is reported with
// message 7, the frame is rendered (12, 10) only when a parameter or the frame number changed,
// and the overlay is drawn over the picture with the viewer's projection. Panel edits,
// keyframe toggles and presets are undo steps of the host. A message the plug-in fails becomes
// the status text and leaves the session usable.
#pragma once

#include <cstdint>
#include <memory>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "layouts/layouts.h"
#include "refhost/engine.h"
#include "scene/scene_document.h"
#include "scene/scene_engine.h"
#include "viewer/view_mapping.h"

namespace veltrane_viewer {

struct ViewerStats {
  int renders = 0;   // message 10
  int previews = 0;  // those of them at a preview size
  double renderSeconds = 0;
  int overlays = 0;  // draw overlay messages
  double overlaySeconds = 0;
};

class ViewerSession {
 public:
  // Sets the scene up in the plug-in (as `veltrane render` does) drawing in `context`, the
  // window's. Throws what startScene throws: FieldError for a bad parameter value, a runtime
  // error naming the module or the message that failed.
  ViewerSession(const veltrane_cli::Scene& scene, const std::string& modulePath,
                refhost::GlProfile profile, std::unique_ptr<refhost::GlContext> context,
                int32_t frame);
  // The same with the engine's options given whole (a module linked into the program).
  ViewerSession(const veltrane_cli::Scene& scene, veltrane_cli::SceneEngineOptions options,
                int32_t frame);
  ViewerSession(const ViewerSession&) = delete;
  ViewerSession& operator=(const ViewerSession&) = delete;

  refhost::Engine& engine() { return *engine_; }
  const refhost::Composition& composition() const { return scene_.composition; }

  int32_t frame() const { return frame_; }
  // Moves to the frame, kept within the scene's frames.
  void setFrame(int32_t frame);

  // The viewer's geometry handed with the pointer and overlay messages.
  void setView(double viewScale, double uiScale, const refhost::Matrix4& projection);

  // Pointer and key messages; each reports the parameter changes it caused.
  void pointerMove(EventPosition position, bool held);
  // True when the plug-in took the press (a drag is under way until the release).
  bool pointerPress(EventPosition position);
  void pointerRelease(EventPosition position);
  // The key as an X11 keysym; true when the plug-in took it.
  bool key(uint32_t keysym, bool down);
  // Asks whether the pointer is over the selected input and if so opens the plug-in's layer
  // menu; the host's popup menu chooser answers it.
  void openLayerMenu();

  // Panel edits at the current frame. Consecutive edits of one parameter form one undo step
  // until finishEdit(), so that a slider drag is one step.
  void editValue(const std::string& id, const refhost::ParamValue& value);
  void finishEdit();
  void toggleKey(const std::string& id);
  // A layout of veltrane_cli::layouts(), each picture framed on its region: one undo step.
  void applyPreset(std::size_t index);
  // Each shown input's picture framed on its region as the cuts now stand: one undo step.
  void fitPicturesToRegions();
  bool undo();
  bool redo();

  // Renders when a parameter or the frame number changed since the last render, or the picture
  // shown is a preview of another size; true when it did. With `preview`, at the size a frame
  // takes at most about 40 ms at (half or a quarter of the frame, judged by the last full
  // render), else at full size. The picture stays until the next render.
  bool renderIfChanged(bool preview = false);
  // The rendered frame's texture, 0 before the first render succeeded, and its size (the
  // frame's, or a preview's).
  uint32_t pictureTexture() const { return picture_ ? picture_->context().output.id : 0; }
  int32_t pictureWidth() const { return picture_ ? picture_->context().width : 0; }
  int32_t pictureHeight() const { return picture_ ? picture_->context().height : 0; }
  // How much smaller than the frame a preview is rendered: 1, 2 or 4.
  int32_t previewDivisor() const;
  // Draws the overlay into the texture, which has the given size.
  void drawOverlay(uint32_t texture, int32_t width, int32_t height);

  // The cursor number the plug-in asked for last.
  int32_t cursor() const { return engine_->cursor(); }
  // True once after the plug-in asked for a redraw.
  bool takeRedrawRequest() { return engine_->takeRedrawRequest(); }
  // What the status line shows: the last failure, or a note such as where the scene was saved.
  const std::string& status() const { return status_; }
  bool statusIsFailure() const { return statusIsFailure_; }
  void setStatus(const std::string& text, bool failure) {
    status_ = text;
    statusIsFailure_ = failure;
  }
  const ViewerStats& stats() const { return stats_; }

  // True when the parameters differ from what was loaded or last saved.
  bool modified();
  // Writes the scene with the current values to `path` (staged, then renamed).
  void save(const std::string& path);
  // The same, without counting as saved: a copy for a render of the scene as it is now.
  void writeCopy(const std::string& path);

  // Messages 4 and 1.
  void finish() { engine_->finish(); }

 private:
  template <typename Action>
  void attempt(const std::string& what, Action&& action);
  // The edits as one undo step of the name, each parameter that changes reported.
  void applyEdits(const std::string& stepName, const std::vector<veltrane_cli::ParamEdit>& edits);
  // The content size at scale 100 of the picture of a layer (kNoLayer or the own layer's GUID
  // for the effect's own input): smaller than the frame along one side for media kept at their
  // own proportions.
  veltrane_cli::Point pictureSizeOf(const std::string& layerGuid) const;
  // Runs a viewer event; a failure becomes the status, and any change asks for a new render.
  template <typename Event>
  refhost::ViewerOutcome event(const std::string& what, Event&& run);
  std::vector<refhost::ParamState> snapshot();

  veltrane_cli::Scene scene_;
  std::unique_ptr<refhost::Engine> engine_;
  refhost::ViewerSettings viewer_;
  int32_t frame_ = 0;
  int32_t renderedFrame_ = -1;
  int32_t renderedDivisor_ = 1;
  double lastFullRenderSeconds_ = 0;
  std::unique_ptr<refhost::RenderFrame> picture_;
  std::vector<refhost::ParamState> shown_;  // the values of the picture on screen
  std::vector<refhost::ParamState> saved_;
  std::string editing_;  // the parameter whose edit step is open
  std::string status_;
  bool statusIsFailure_ = false;
  ViewerStats stats_;
};

}  // namespace veltrane_viewer
