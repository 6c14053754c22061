// The scene as a document of the viewer: saving it where Save writes, Save As elsewhere, the
// question before unsaved changes are closed, and renders of it as it is now, made in the
// background while the window goes on.
#pragma once

#include <memory>
#include <string>

#include "scene/scene_document.h"
#include "viewer/background_render.h"
#include "viewer/viewer_chrome.h"
#include "viewer/viewer_dialogs.h"
#include "viewer/viewer_session.h"

namespace veltrane_viewer {

class ViewerDocument {
 public:
  // `savePath`: where Save writes (the scene file itself unless given); `modulePath`: the
  // module a render loads.
  ViewerDocument(ViewerSession& session, const veltrane_cli::Scene& scene, std::string savePath,
                 std::string modulePath);
  ~ViewerDocument();
  ViewerDocument(const ViewerDocument&) = delete;
  ViewerDocument& operator=(const ViewerDocument&) = delete;

  const std::string& savePath() const { return savePath_; }
  // Writes the scene where Save writes; a failure becomes the status. True when saved.
  bool save();
  void openSaveAs();
  void openRender();
  // Quitting or closing the window: asks first when there are unsaved changes.
  void requestQuit();
  // True once the window may close.
  bool quitting() const { return quitting_; }

  bool dialogOpen() const { return prompt_.open || saveAs_.open || render_.open; }
  // A key pressed while a dialog is open: S, D and Escape answer the unsaved-changes question,
  // Enter accepts the other dialogs and Escape closes them. True when the key was the dialog's.
  bool dialogKey(int glfwKey);
  // Draws the dialog that is open into the current ImGui frame and acts on its answer.
  void drawDialogs();

  // Reads the background render's progress; true while one runs.
  bool pollRender();
  RenderProgress renderProgress() const;
  void stopRender();

 private:
  bool saveTo(const std::string& path);
  void acceptSaveAs();
  void startRender();

  ViewerSession& session_;
  std::vector<std::string> inputs_;  // the scene's media: never written over
  std::string savePath_;
  std::string modulePath_;
  bool quitting_ = false;
  // Enter was pressed: the dialog accepts once its fields have taken the text typed before it
  // (the window reads keys before the frame that fills the fields).
  bool enterPressed_ = false;
  UnsavedPrompt prompt_;
  SaveAsDialog saveAs_;
  RenderDialog render_;
  std::unique_ptr<BackgroundRender> running_;
  std::string renderOutput_;
  std::string renderFolder_;  // the temporary folder of the scene copy it renders
};

}  // namespace veltrane_viewer
