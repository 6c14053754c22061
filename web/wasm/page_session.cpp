// The page's scene on the viewer's session: opening, describing, editing, rendering, showing.
#include "page_session.h"

#include <GL/glew.h>

#include <filesystem>
#include <stdexcept>

#include "layouts/layouts.h"
#include "output/panel_report.h"
#include "scene/json_fields.h"
#include "scene/scene_params.h"
#include "viewer/panel_values.h"

extern "C" {
void PluginInfo(void*, void*, PluginRegistration* record);
int32_t Notify(WispHost* host, tagWispAPI* api, int32_t message);
}

namespace veltrane_web {
namespace {

using Json = nlohmann::ordered_json;

std::string directoryOf(const std::string& path) {
  std::string parent = std::filesystem::path(path).parent_path().string();
  return parent.empty() ? "." : parent;
}

const char* keyStateName(veltrane_viewer::KeyState state) {
  switch (state) {
    case veltrane_viewer::KeyState::Animated:
      return "animated";
    case veltrane_viewer::KeyState::KeyHere:
      return "key";
    case veltrane_viewer::KeyState::Static:
      break;
  }
  return "static";
}

}  // namespace

PageSession::PageSession()
    : adopted_(refhost::GlContext::adoptCurrent(refhost::GlProfile::Core, [] {})),
      canvas_(std::make_unique<veltrane_viewer::ViewCanvas>()) {}

PageSession::~PageSession() {
  picture_.reset();
  if (session_) session_->finish();
}

std::string PageSession::open(const std::string& text, const std::string& file) {
  try {
    Json document;
    try {
      document = Json::parse(text);
    } catch (const Json::parse_error& error) {
      throw std::runtime_error(file + ": not JSON (" + error.what() + ")");
    }
    veltrane_cli::Scene scene = veltrane_cli::sceneFromJson(document, file, directoryOf(file));
    veltrane_cli::SceneEngineOptions options;
    options.modulePath = "veltrane (linked in)";
    options.entryPoints = refhost::ModuleEntryPoints{&PluginInfo, &Notify};
    options.context = refhost::GlContext::adoptCurrent(refhost::GlProfile::Core, [] {});
    auto session = std::make_unique<veltrane_viewer::ViewerSession>(scene, std::move(options), 0);
    picture_.reset();
    if (session_) session_->finish();
    session_ = std::move(session);
    scene_ = std::move(scene);
    mapping_ = std::make_unique<veltrane_viewer::ViewMapping>(scene_.composition.width,
                                                              scene_.composition.height);
    updateView();
    return "";
  } catch (const std::exception& error) {
    return error.what();
  }
}

std::string PageSession::describe() const {
  const refhost::Composition& composition = scene_.composition;
  Json layers = Json::array();
  for (const veltrane_viewer::LayerOption& option : veltrane_viewer::layerOptions(composition))
    layers.push_back({{"guid", option.guid}, {"name", option.label}});
  Json layouts = Json::array();
  for (const veltrane_cli::LayoutInfo& layout : veltrane_cli::layouts())
    layouts.push_back(
        {{"name", layout.name}, {"menuName", layout.menuName}, {"regions", layout.regions}});
  return Json{{"width", composition.width},
              {"height", composition.height},
              {"fps", composition.frameRate.perSecond()},
              {"rate", {composition.frameRate.numerator, composition.frameRate.denominator}},
              {"duration", composition.duration},
              {"layers", layers},
              {"layouts", layouts},
              {"defaultLayout",
               veltrane_cli::defaultLayoutFor(static_cast<int32_t>(composition.layers.size()) + 1)},
              {"panel", veltrane_cli::panelJson(session_->engine().panel())}}
      .dump();
}

std::string PageSession::state() const {
  refhost::Engine& engine = session_->engine();
  const int32_t frame = session_->frame();
  Json values = Json::object(), enabled = Json::object(), keys = Json::object();
  for (const refhost::Param& param : engine.panel().params()) {
    values[param.id] = veltrane_cli::paramValueJson(param, param.valueAt(frame));
    enabled[param.id] = param.enabled;
    keys[param.id] = keyStateName(veltrane_viewer::keyState(param, frame));
  }
  return Json{{"frame", frame},
              {"values", values},
              {"enabled", enabled},
              {"keys", keys},
              {"undo", engine.undoStepNames()},
              {"redo", engine.redoStepNames()},
              {"status", session_->status()}}
      .dump();
}

std::string PageSession::edit(const std::string& id, const std::string& valueJson) {
  try {
    // Checked as a scene's value is, so the panel can hand on what a person typed.
    Json wrapped = {{"params", {{id, Json::parse(valueJson)}}}};
    veltrane_cli::JsonField document(wrapped, "the panel");
    std::set<std::string> guids = scene_.layerGuids();
    std::vector<veltrane_cli::ParamSetting> settings = veltrane_cli::readParamSettings(
        document.member("params"), session_->engine().panel(), guids);
    for (const veltrane_cli::ParamSetting& setting : settings)
      session_->editValue(setting.id, setting.value);
    return "";
  } catch (const std::exception& error) {
    return error.what();
  }
}

std::string PageSession::applyLayout(int32_t index) {
  try {
    session_->applyPreset(static_cast<std::size_t>(index));
    return "";
  } catch (const std::exception& error) {
    return error.what();
  }
}

void PageSession::setCanvasSize(int32_t width, int32_t height, double density) {
  canvasWidth_ = width > 0 ? width : 1;
  canvasHeight_ = height > 0 ? height : 1;
  density_ = density > 0 ? density : 1;
  canvas_->resize(canvasWidth_, canvasHeight_);
  if (session_) updateView();
}

void PageSession::updateView() {
  mapping_->setArea({0, 0, static_cast<double>(canvasWidth_), static_cast<double>(canvasHeight_)});
  mapping_->fit();
  session_->setView(mapping_->viewScale(),
                    veltrane_viewer::handleScale(density_, mapping_->viewScale()),
                    mapping_->projection(canvasWidth_, canvasHeight_));
}

int32_t PageSession::pointer(int32_t kind, double x, double y, bool held) {
  const veltrane_viewer::EventPosition at =
      veltrane_viewer::eventPosition(mapping_->toCorner({x, y}));
  if (kind == 1)
    session_->pointerPress(at);
  else if (kind == 2)
    session_->pointerRelease(at);
  else
    session_->pointerMove(at, held);
  return session_->cursor();
}

std::string PageSession::render(int32_t divisor) {
  try {
    picture_ = session_->engine().renderPreview(session_->frame(), divisor);
    return "";
  } catch (const std::exception& error) {
    picture_.reset();
    return "frame " + std::to_string(session_->frame()) + ": " + error.what();
  }
}

void PageSession::present() {
  const uint32_t texture = picture_ ? picture_->context().output.id : 0;
  canvas_->showPicture(texture, pictureWidth(), pictureHeight(), mapping_->frameRect());
  session_->drawOverlay(canvas_->texture(), canvas_->width(), canvas_->height());
  canvas_->present();
}

int32_t PageSession::pictureWidth() const { return picture_ ? picture_->context().width : 0; }
int32_t PageSession::pictureHeight() const { return picture_ ? picture_->context().height : 0; }

const std::vector<uint8_t>& PageSession::readPicture() {
  const int32_t width = pictureWidth(), height = pictureHeight();
  const std::size_t rowBytes = static_cast<std::size_t>(width) * 4;
  // Both buffers keep their storage from frame to frame: an export reads every frame.
  rows_.resize(rowBytes * height);
  readBack_.resize(rows_.size());
  if (picture_) {
    // WebGL reads textures back only through a framebuffer.
    GLuint framebuffer = 0;
    glGenFramebuffers(1, &framebuffer);
    glBindFramebuffer(GL_FRAMEBUFFER, framebuffer);
    glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D,
                           picture_->context().output.id, 0);
    glPixelStorei(GL_PACK_ALIGNMENT, 1);
    glReadPixels(0, 0, width, height, GL_RGBA, GL_UNSIGNED_BYTE, rows_.data());
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    glDeleteFramebuffers(1, &framebuffer);
  }
  refhost::copyRowsFlipped(rows_.data(), readBack_.data(), rowBytes, height);
  return readBack_;
}

std::string PageSession::save(const std::string& path) {
  try {
    session_->save(path);
    return "";
  } catch (const std::exception& error) {
    return error.what();
  }
}

}  // namespace veltrane_web
