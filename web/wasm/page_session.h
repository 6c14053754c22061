// The page's one scene in the plug-in: the viewer's session (the command line's own code) in the
// canvas's WebGL 2 context, with the view the canvas shows and the picture rendered last.
// Everything crosses to the page's script as numbers, strings and JSON texts; failures come
// back as one line of text and leave what was open as it was.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "viewer/view_canvas.h"
#include "viewer/view_mapping.h"
#include "viewer/viewer_session.h"

namespace veltrane_web {

class PageSession {
 public:
  // Takes the WebGL 2 context current on this thread, the canvas's.
  PageSession();
  ~PageSession();
  PageSession(const PageSession&) = delete;
  PageSession& operator=(const PageSession&) = delete;

  // Reads a scene document (`file` names it in messages and resolves its relative file names
  // in the page's file system) and starts it in the plug-in. Returns "" or the reason it was
  // refused; a refused scene leaves the open one untouched.
  std::string open(const std::string& text, const std::string& file);
  bool isOpen() const { return session_ != nullptr; }

  // {"width", "height", "fps" (frames a second), "rate": [numerator, denominator], "duration",
  // "layers": [{guid, name}], "panel": declared tree, "layouts": [{name, menuName, regions}]}.
  std::string describe() const;
  // {"values": {id: value at the frame}, "enabled": {id: bool}, "keys": {id: "static" |
  // "animated" | "key"}, "undo": [names], "redo": [names], "status": text}.
  std::string state() const;
  int32_t frame() const { return session_->frame(); }
  void setFrame(int32_t frame) { session_->setFrame(frame); }

  // A panel edit at the current frame, the value written as a scene writes it; consecutive
  // edits of one parameter are one undo step until finishEdit. Returns "" or why the value was
  // refused.
  std::string edit(const std::string& id, const std::string& valueJson);
  void finishEdit() { session_->finishEdit(); }
  void toggleKey(const std::string& id) { session_->toggleKey(id); }
  // One of the shared layouts (index into veltrane_cli::layouts()), one undo step.
  std::string applyLayout(int32_t index);
  void fitPictures() { session_->fitPicturesToRegions(); }
  bool undo() { return session_->undo(); }
  bool redo() { return session_->redo(); }

  // The canvas's framebuffer size; the frame is fitted into it again.
  void setCanvasSize(int32_t width, int32_t height, double density);
  // Pointer events at framebuffer pixels (top-left origin); `kind` 0 move, 1 press, 2 release.
  // Returns the cursor the plug-in asked for.
  int32_t pointer(int32_t kind, double x, double y, bool held);
  // An X11 keysym; true when the plug-in took it.
  bool key(uint32_t keysym, bool down) { return session_->key(keysym, down); }

  // Renders the current frame at 1 / divisor of its size. Returns "" or the failure.
  std::string render(int32_t divisor);
  // The last picture with the overlay over it, on the canvas.
  void present();
  // The last picture's RGBA bytes, top row first (empty before a render), valid until the
  // next call.
  const std::vector<uint8_t>& readPicture();
  int32_t pictureWidth() const;
  int32_t pictureHeight() const;

  // Writes the scene with the values as they are to `path` in the page's file system.
  std::string save(const std::string& path);

 private:
  void updateView();

  std::unique_ptr<refhost::GlContext> adopted_;  // until a session takes it
  std::unique_ptr<veltrane_viewer::ViewerSession> session_;
  std::unique_ptr<refhost::RenderFrame> picture_;
  std::unique_ptr<veltrane_viewer::ViewCanvas> canvas_;
  std::unique_ptr<veltrane_viewer::ViewMapping> mapping_;
  veltrane_cli::Scene scene_;
  int32_t canvasWidth_ = 1;
  int32_t canvasHeight_ = 1;
  double density_ = 1;
  std::vector<uint8_t> rows_;  // as GL reads them, bottom row first
  std::vector<uint8_t> readBack_;
};

}  // namespace veltrane_web
