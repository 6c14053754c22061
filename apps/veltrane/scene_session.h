// A scene running in the plug-in: its composition installed in the host, the plug-in loaded,
// the scene's parameters checked against the declared panel and set, an instance created and
// GL started; frames rendered on request.
#pragma once

#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>

#include "plugin_session.h"
#include "refhost/engine/render_frame.h"
#include "refhost/media/rgba_image.h"
#include "scene_file.h"
#include "scene_params.h"

namespace veltrane_cli {

class SceneSession {
 public:
  // Sends 0 and 2, checks the scene's parameters (FieldError on a bad one), sends 3 and 8,
  // sets the parameters and reports each change with message 7. The host reports `hostId` as
  // its product code from the start; it draws in `context` (a window's) when one is given.
  SceneSession(const Scene& scene, const std::string& modulePath, refhost::GlProfile profile,
               int32_t hostId = 0, std::unique_ptr<refhost::GlContext> context = nullptr);

  PluginSession& plugin() { return plugin_; }
  refhost::Host& host() { return plugin_.host(); }
  const refhost::FrameSettings& frameSettings() const { return settings_; }

  // Checks and sets parameter values written as a scene's "params" object, reporting each
  // change with message 7. Throws FieldError naming `file` for a bad one.
  void applyParams(const nlohmann::json& params, const std::string& file);

  // Messages 12 and 10 with the frame's render context; the output read back, top row first.
  // Running out of memory on the way is reported as the scene's frame size being too large.
  refhost::RgbaImage render(int32_t frame);
  // The same, keeping the rendered frame's textures for whoever shows them.
  std::unique_ptr<refhost::RenderFrame> renderFrame(int32_t frame);
  // Messages 12 and 10 with a render context made for the frame; its output stays in GL.
  void draw(refhost::RenderFrame& frame);

  // The error for an allocation that failed while this scene ran: it names the scene file and
  // the frame size, the one thing a user can change about it.
  std::runtime_error memoryError() const;

  // Messages 4 and 1.
  void finish() { plugin_.finish(); }

 private:
  void setParams(const std::vector<ParamSetting>& settings);

  PluginSession plugin_;
  std::string file_;
  std::size_t layerCount_ = 0;
  refhost::FrameSettings settings_;
  std::set<std::string> layerGuids_;
};

}  // namespace veltrane_cli
