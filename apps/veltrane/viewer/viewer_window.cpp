// The window, its event loop, the pointer and key bindings, and the popup menu the layer
// picker asks for.
#include "viewer/viewer_window.h"

#include <imgui.h>
#include <imgui_impl_glfw.h>
#include <imgui_impl_opengl3.h>

#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <stdexcept>
#include <vector>

#include "viewer/cursor_shapes.h"
#include "viewer/view_canvas.h"
#include "viewer/viewer_chrome.h"
#include "viewer/viewer_session.h"
#include "viewer/window_system.h"

namespace veltrane_viewer {
namespace {

constexpr double kWheelZoomStep = 1.15;
// A dragging pointer that has not moved for this long rests: the frame is rendered at full size.
constexpr double kRestSeconds = 0.2;

class ViewerWindow {
 public:
  ViewerWindow(const veltrane_cli::Scene& scene, const ViewOptions& options);
  ~ViewerWindow();
  ViewerWindow(const ViewerWindow&) = delete;
  ViewerWindow& operator=(const ViewerWindow&) = delete;

  void run();

 private:
  static ViewerWindow& of(GLFWwindow* window) {
    return *static_cast<ViewerWindow*>(glfwGetWindowUserPointer(window));
  }
  void queue(const InputEvent& event) {
    if (!menuOpen_) events_.push_back(event);
  }

  void waitForEvents();
  void processEvents();
  void onMove(const InputEvent& event);
  void onButton(const InputEvent& event);
  void onKey(const InputEvent& event);
  bool onViewerKey(int key, int mods);
  Point2 toPixel(double windowX, double windowY) const;
  Point2 areaCentre() const {
    const PixelRect& area = mapping_.area();
    return {area.x + area.width / 2, area.y + area.height / 2};
  }
  bool overPicture(Point2 pixel) const;
  EventPosition eventAt(Point2 pixel) const;
  void updateView();
  void updateCursor();
  void advancePlayback();
  void setPlaying(bool playing);
  void stepTo(int32_t frame);
  void drawFrame();
  void handleActions(const ViewerActions& actions);
  void save();
  void updateTitle();
  int32_t chooseFromMenu(const std::string& items);
  ChromeState chromeState() const;
  void want(int frames) { pendingFrames_ = std::max(pendingFrames_, frames); }
  // Frames are rendered at a preview size while a handle is dragged (until the pointer rests)
  // or the timeline plays, and at full size otherwise.
  bool previewing() const {
    return playing_ || (dragging_ && glfwGetTime() - lastDragMove_ < kRestSeconds);
  }
  void printStats() const;

  const veltrane_cli::Scene& scene_;
  ViewOptions options_;
  GlfwLibrary glfw_;
  WindowHandle window_;
  float uiScale_ = 1;
  std::unique_ptr<ViewerSession> session_;
  std::unique_ptr<ImGuiRuntime> imgui_;
  std::unique_ptr<ViewCanvas> canvas_;
  ViewMapping mapping_;
  ChromeLayout layout_;
  std::vector<LayerOption> layers_;
  GLFWcursor* cursors_[6] = {};
  int shownCursor_ = -1;

  std::vector<InputEvent> events_;
  bool menuOpen_ = false;
  int pendingFrames_ = 2;
  int windowWidth_ = kInitialWidth;
  int windowHeight_ = kInitialHeight;
  int framebufferWidth_ = kInitialWidth;
  int framebufferHeight_ = kInitialHeight;
  Point2 pointer_;  // framebuffer pixels
  bool buttonInPicture_ = false;
  bool panning_ = false;
  bool quit_ = false;
  bool playing_ = false;
  double playStartTime_ = 0;
  int32_t playStartFrame_ = 0;
  std::string title_;

  // Statistics for --stats: the time from taking a batch of events to the frame on screen,
  // split by whether the frame was rendered again or only the overlay redrawn; and the frames
  // shown while a handle is dragged.
  struct FrameTimes {
    int count = 0;
    double seconds = 0;
  } rendered_, overlayOnly_;
  bool dragging_ = false;
  int dragFrames_ = 0;
  double dragSeconds_ = 0;
  double dragStart_ = 0;
  double lastDragMove_ = -1e9;
};

ViewerWindow::ViewerWindow(const veltrane_cli::Scene& scene, const ViewOptions& options)
    : scene_(scene),
      options_(options),
      window_(createWindow(options.profile)),
      mapping_(scene.composition.width, scene.composition.height),
      layers_(layerOptions(scene.composition)) {
  GLFWwindow* window = window_.get();
  float scaleY = 1;
  glfwGetWindowContentScale(window, &uiScale_, &scaleY);
  auto context = refhost::GlContext::adoptCurrent(options.profile,
                                                  [window] { glfwMakeContextCurrent(window); });
  session_ = std::make_unique<ViewerSession>(scene, options.modulePath, options.profile,
                                             std::move(context), options.frame);
  session_->engine().setPopupMenuChooser(
      [this](const std::string& items) { return chooseFromMenu(items); });

  glfwSetWindowUserPointer(window, this);
  glfwSetCursorPosCallback(window, [](GLFWwindow* w, double x, double y) {
    of(w).queue({InputEvent::Kind::Move, x, y, 0, 0, 0});
  });
  glfwSetMouseButtonCallback(window, [](GLFWwindow* w, int button, int action, int mods) {
    of(w).queue({InputEvent::Kind::Button, 0, 0, button, action, mods});
  });
  glfwSetScrollCallback(window, [](GLFWwindow* w, double dx, double dy) {
    of(w).queue({InputEvent::Kind::Scroll, dx, dy, 0, 0, 0});
  });
  glfwSetKeyCallback(window, [](GLFWwindow* w, int key, int, int action, int mods) {
    of(w).queue({InputEvent::Kind::Key, 0, 0, key, action, mods});
  });
  glfwSetWindowRefreshCallback(window, [](GLFWwindow* w) { of(w).want(1); });
  imgui_ = std::make_unique<ImGuiRuntime>(window, uiScale_);
  canvas_ = std::make_unique<ViewCanvas>();
  const int shapes[6] = {GLFW_ARROW_CURSOR, GLFW_IBEAM_CURSOR,   GLFW_CROSSHAIR_CURSOR,
                         GLFW_HAND_CURSOR,  GLFW_HRESIZE_CURSOR, GLFW_VRESIZE_CURSOR};
  for (int i = 0; i < 6; ++i) cursors_[i] = glfwCreateStandardCursor(shapes[i]);
}

ViewerWindow::~ViewerWindow() {
  glfwMakeContextCurrent(window_.get());
  canvas_.reset();
  imgui_.reset();
  session_.reset();
  for (GLFWcursor* cursor : cursors_) glfwDestroyCursor(cursor);
}

void ViewerWindow::run() {
  glfwShowWindow(window_.get());
  while (!glfwWindowShouldClose(window_.get()) && !quit_) {
    waitForEvents();
    double start = glfwGetTime();
    int renders = session_->stats().renders;
    glfwGetWindowSize(window_.get(), &windowWidth_, &windowHeight_);
    glfwGetFramebufferSize(window_.get(), &framebufferWidth_, &framebufferHeight_);
    updateView();
    processEvents();
    advancePlayback();
    if (session_->renderIfChanged(previewing())) want(1);
    if (session_->takeRedrawRequest()) want(1);
    updateCursor();
    if (pendingFrames_ > 0) {
      --pendingFrames_;
      drawFrame();
      FrameTimes& times = session_->stats().renders > renders ? rendered_ : overlayOnly_;
      ++times.count;
      times.seconds += glfwGetTime() - start;
    }
  }
  if (session_->modified()) std::fprintf(stderr, "veltrane view: closed with unsaved changes\n");
  session_->finish();
  if (options_.stats) printStats();
}

void ViewerWindow::waitForEvents() {
  if (pendingFrames_ > 0) {
    glfwPollEvents();
  } else if (playing_) {
    double next = playStartTime_ + (session_->frame() - playStartFrame_ + 1) /
                                       std::max(scene_.composition.frameRate.perSecond(), 0.001);
    glfwWaitEventsTimeout(std::max(next - glfwGetTime(), 0.0));
  } else if (previewing()) {
    // Woken when the pointer comes to rest, to show the frame at full size.
    glfwWaitEventsTimeout(std::max(lastDragMove_ + kRestSeconds - glfwGetTime(), 0.0));
  } else {
    glfwWaitEvents();
  }
}

Point2 ViewerWindow::toPixel(double windowX, double windowY) const {
  return {windowX * framebufferWidth_ / std::max(windowWidth_, 1),
          windowY * framebufferHeight_ / std::max(windowHeight_, 1)};
}

// Decided from the layout, not from ImGui's wish to capture the mouse, which is only brought up
// to date when a frame is drawn: a move from the panel onto the picture and a click that arrive
// together must both reach the plug-in. Only an open menu or popup takes the picture's pointer.
bool ViewerWindow::overPicture(Point2 pixel) const {
  return mapping_.area().contains(pixel) &&
         !ImGui::IsPopupOpen("", ImGuiPopupFlags_AnyPopupId | ImGuiPopupFlags_AnyPopupLevel);
}

EventPosition ViewerWindow::eventAt(Point2 pixel) const {
  return eventPosition(mapping_.toCorner(pixel));
}

void ViewerWindow::updateView() {
  session_->setView(mapping_.viewScale(), handleScale(uiScale_, mapping_.viewScale()),
                    mapping_.projection(framebufferWidth_, framebufferHeight_));
}

void ViewerWindow::processEvents() {
  std::vector<InputEvent> events;
  events.swap(events_);
  for (const InputEvent& event : events) {
    switch (event.kind) {
      case InputEvent::Kind::Move:
        onMove(event);
        break;
      case InputEvent::Kind::Button:
        onButton(event);
        break;
      case InputEvent::Kind::Scroll:
        if (overPicture(pointer_)) {
          mapping_.zoomAbout(pointer_, std::pow(kWheelZoomStep, event.y));
          updateView();
        }
        want(2);
        break;
      case InputEvent::Kind::Key:
        onKey(event);
        break;
    }
  }
}

void ViewerWindow::onMove(const InputEvent& event) {
  Point2 pixel = toPixel(event.x, event.y);
  Point2 previous = pointer_;
  pointer_ = pixel;
  if (panning_) {
    mapping_.panBy(pixel.x - previous.x, pixel.y - previous.y);
    updateView();
    want(1);
  } else if (buttonInPicture_) {
    session_->pointerMove(eventAt(pixel), true);
    lastDragMove_ = glfwGetTime();
  } else if (overPicture(pixel)) {
    session_->pointerMove(eventAt(pixel), false);
  }
  // The chrome follows the pointer only while it is over it (hover highlights).
  if (ImGui::GetIO().WantCaptureMouse || !mapping_.area().contains(pixel)) want(2);
}

void ViewerWindow::onButton(const InputEvent& event) {
  bool press = event.action == GLFW_PRESS;
  want(2);
  if (!press) {
    if (panning_ && event.code != GLFW_MOUSE_BUTTON_RIGHT) panning_ = false;
    if (buttonInPicture_ && event.code == GLFW_MOUSE_BUTTON_LEFT) {
      buttonInPicture_ = false;
      session_->pointerRelease(eventAt(pointer_));
      if (dragging_) dragSeconds_ += glfwGetTime() - dragStart_;
      dragging_ = false;
    }
    return;
  }
  if (!overPicture(pointer_)) return;
  bool alt = (event.mods & GLFW_MOD_ALT) != 0;
  if (event.code == GLFW_MOUSE_BUTTON_MIDDLE || (event.code == GLFW_MOUSE_BUTTON_LEFT && alt)) {
    panning_ = true;
  } else if (event.code == GLFW_MOUSE_BUTTON_LEFT) {
    buttonInPicture_ = true;
    dragging_ = session_->pointerPress(eventAt(pointer_));
    dragStart_ = glfwGetTime();
  } else if (event.code == GLFW_MOUSE_BUTTON_RIGHT) {
    session_->openLayerMenu();
  }
}

void ViewerWindow::onKey(const InputEvent& event) {
  if (ImGui::GetIO().WantTextInput) return;  // typing into a field
  want(2);
  if (uint32_t keysym = keysymFor(event.code); keysym && event.action != GLFW_REPEAT) {
    session_->key(keysym, event.action == GLFW_PRESS);
    return;
  }
  if (event.action != GLFW_RELEASE) onViewerKey(event.code, event.mods);
}

bool ViewerWindow::onViewerKey(int key, int mods) {
  if (mods & GLFW_MOD_CONTROL) {
    if (key == GLFW_KEY_Z && (mods & GLFW_MOD_SHIFT)) return session_->redo();
    if (key == GLFW_KEY_Z) return session_->undo();
    if (key == GLFW_KEY_Y) return session_->redo();
    if (key == GLFW_KEY_S) save();
    if (key == GLFW_KEY_Q) quit_ = true;
    return true;
  }
  switch (key) {
    case GLFW_KEY_F:
      mapping_.fit();
      break;
    case GLFW_KEY_1:
    case GLFW_KEY_KP_1:
      mapping_.showActualPixels();
      break;
    case GLFW_KEY_EQUAL:  // "+" without Shift, as editors take it
    case GLFW_KEY_KP_ADD:
      mapping_.zoomAbout(areaCentre(), 2);
      break;
    case GLFW_KEY_MINUS:
    case GLFW_KEY_KP_SUBTRACT:
      mapping_.zoomAbout(areaCentre(), 0.5);
      break;
    case GLFW_KEY_SPACE:
      setPlaying(!playing_);
      break;
    case GLFW_KEY_LEFT:
      stepTo(session_->frame() - 1);
      break;
    case GLFW_KEY_RIGHT:
      stepTo(session_->frame() + 1);
      break;
    case GLFW_KEY_HOME:
      stepTo(0);
      break;
    case GLFW_KEY_END:
      stepTo(scene_.composition.duration - 1);
      break;
    default:
      return false;
  }
  updateView();
  return true;
}

void ViewerWindow::setPlaying(bool playing) {
  playing_ = playing;
  playStartTime_ = glfwGetTime();
  playStartFrame_ = session_->frame();
}

void ViewerWindow::stepTo(int32_t frame) {
  setPlaying(false);
  session_->setFrame(frame);
}

void ViewerWindow::advancePlayback() {
  if (!playing_) return;
  int32_t duration = std::max(scene_.composition.duration, 1);
  double elapsed = glfwGetTime() - playStartTime_;
  auto advanced =
      static_cast<int64_t>(std::floor(elapsed * scene_.composition.frameRate.perSecond()));
  auto frame = static_cast<int32_t>((playStartFrame_ + advanced) % duration);
  if (frame != session_->frame()) session_->setFrame(frame);
}

void ViewerWindow::updateCursor() {
  bool ours = (buttonInPicture_ || overPicture(pointer_)) && !panning_;
  ImGuiIO& io = ImGui::GetIO();
  if (!ours) {
    io.ConfigFlags &= ~ImGuiConfigFlags_NoMouseCursorChange;
    shownCursor_ = -1;
    return;
  }
  io.ConfigFlags |= ImGuiConfigFlags_NoMouseCursorChange;
  int shape = standardCursorFor(session_->cursor());
  if (shape == shownCursor_) return;
  shownCursor_ = shape;
  glfwSetCursor(window_.get(), cursors_[shape - GLFW_ARROW_CURSOR]);
}

ChromeState ViewerWindow::chromeState() const {
  ChromeState state;
  state.title = std::filesystem::path(scene_.file).filename().string();
  state.playing = playing_;
  state.frameRate = scene_.composition.frameRate.perSecond();
  state.duration = scene_.composition.duration;
  state.layers = layers_;
  state.uiScale = uiScale_;
  return state;
}

void ViewerWindow::drawFrame() {
  ImGui_ImplOpenGL3_NewFrame();
  ImGui_ImplGlfw_NewFrame();
  ImGui::NewFrame();
  ViewerActions actions = drawChrome(*session_, chromeState(), static_cast<float>(windowWidth_),
                                     static_cast<float>(windowHeight_), layout_);
  ImGui::Render();
  handleActions(actions);

  double sx = static_cast<double>(framebufferWidth_) / std::max(windowWidth_, 1);
  double sy = static_cast<double>(framebufferHeight_) / std::max(windowHeight_, 1);
  PixelRect area{0, layout_.menuHeight * sy, (windowWidth_ - layout_.panelWidth) * sx,
                 (windowHeight_ - layout_.menuHeight - layout_.bottomHeight) * sy};
  const PixelRect& shown = mapping_.area();
  if (area.x != shown.x || area.y != shown.y || area.width != shown.width ||
      area.height != shown.height)
    mapping_.setArea(area);
  updateView();
  session_->renderIfChanged(previewing());

  canvas_->resize(framebufferWidth_, framebufferHeight_);
  canvas_->showPicture(session_->pictureTexture(), session_->pictureWidth(),
                       session_->pictureHeight(), mapping_.frameRect());
  session_->drawOverlay(canvas_->texture(), framebufferWidth_, framebufferHeight_);
  canvas_->present();
  glViewport(0, 0, framebufferWidth_, framebufferHeight_);
  ImGui_ImplOpenGL3_RenderDrawData(ImGui::GetDrawData());
  glfwSwapBuffers(window_.get());
  updateTitle();
  if (dragging_) ++dragFrames_;
}

void ViewerWindow::handleActions(const ViewerActions& actions) {
  bool acted = true;
  if (actions.save) save();
  if (actions.quit) quit_ = true;
  if (actions.fit) mapping_.fit();
  if (actions.actualPixels) mapping_.showActualPixels();
  if (actions.undo) session_->undo();
  if (actions.redo) session_->redo();
  if (actions.togglePlay) setPlaying(!playing_);
  if (actions.preset >= 0) session_->applyPreset(static_cast<std::size_t>(actions.preset));
  if (actions.fitPictures) session_->fitPicturesToRegions();
  for (int i = 0; i < actions.undoSteps; ++i) session_->undo();
  for (int i = 0; i < actions.redoSteps; ++i) session_->redo();
  if (actions.frame >= 0) stepTo(actions.frame);
  acted = actions.save || actions.fit || actions.actualPixels || actions.undo || actions.redo ||
          actions.togglePlay || actions.preset >= 0 || actions.fitPictures || actions.undoSteps ||
          actions.redoSteps || actions.frame >= 0;
  if (acted) want(1);
}

void ViewerWindow::save() {
  std::string path = options_.savePath.empty() ? scene_.file : options_.savePath;
  try {
    session_->save(path);
  } catch (const std::exception& error) {
    session_->setStatus(error.what(), true);
    std::fprintf(stderr, "veltrane view: %s\n", error.what());
    return;
  }
  session_->setStatus("saved " + path, false);
  // What was saved and the edits that led to it, for the terminal the viewer runs in.
  auto quotedList = [](const std::vector<std::string>& steps) {
    std::string list;
    for (const std::string& step : steps) list += (list.empty() ? "\"" : ", \"") + step + "\"";
    return list.empty() ? std::string("none") : list;
  };
  std::printf("saved %s; undo history: %s; undone: %s\n", path.c_str(),
              quotedList(session_->engine().undoStepNames()).c_str(),
              quotedList(session_->engine().redoStepNames()).c_str());
  std::fflush(stdout);
}

void ViewerWindow::updateTitle() {
  std::string title = "veltrane view - " + std::filesystem::path(scene_.file).filename().string() +
                      (session_->modified() ? " *" : "");
  if (title == title_) return;
  title_ = title;
  glfwSetWindowTitle(window_.get(), title.c_str());
}

// Runs while the plug-in waits in its layer message: the chrome is shown but inert, the last
// canvas stays on screen, and the menu sits at the pointer until a choice or a click elsewhere.
int32_t ViewerWindow::chooseFromMenu(const std::string& text) {
  std::vector<std::string> items = menuItems(text);
  menuOpen_ = true;
  int32_t chosen = -1;
  bool open = true;
  for (int frame = 0; open && !glfwWindowShouldClose(window_.get()); ++frame) {
    if (frame < 2)
      glfwPollEvents();
    else
      glfwWaitEvents();
    ImGui_ImplOpenGL3_NewFrame();
    ImGui_ImplGlfw_NewFrame();
    ImGui::NewFrame();
    ImGui::BeginDisabled();
    ChromeLayout unused;
    drawChrome(*session_, chromeState(), static_cast<float>(windowWidth_),
               static_cast<float>(windowHeight_), unused);
    ImGui::EndDisabled();
    if (frame == 0) ImGui::OpenPopup("layers");
    if (ImGui::BeginPopup("layers")) {
      for (std::size_t i = 0; i < items.size(); ++i) {
        std::string label = (items[i].empty() ? "(no name)" : items[i]) + "##" + std::to_string(i);
        if (ImGui::Selectable(label.c_str())) chosen = static_cast<int32_t>(i);
      }
      ImGui::EndPopup();
    }
    open = chosen < 0 && ImGui::IsPopupOpen("layers");
    ImGui::Render();
    canvas_->present();
    glViewport(0, 0, framebufferWidth_, framebufferHeight_);
    ImGui_ImplOpenGL3_RenderDrawData(ImGui::GetDrawData());
    glfwSwapBuffers(window_.get());
  }
  menuOpen_ = false;
  want(2);
  return chosen;
}

void ViewerWindow::printStats() const {
  const ViewerStats& stats = session_->stats();
  auto each = [](double seconds, int count) { return count ? 1000 * seconds / count : 0.0; };
  std::printf(
      "frames: %d rendered again (%.1f ms from input to screen), %d with only the overlay "
      "redrawn (%.1f ms); message 10 with 12: %.1f ms, message 1003: %.1f ms; while dragging: "
      "%d frames in %.2f s, %.1f per second; %d of %d renders at a preview size\n",
      rendered_.count, each(rendered_.seconds, rendered_.count), overlayOnly_.count,
      each(overlayOnly_.seconds, overlayOnly_.count), each(stats.renderSeconds, stats.renders),
      each(stats.overlaySeconds, stats.overlays), dragFrames_, dragSeconds_,
      dragSeconds_ > 0 ? dragFrames_ / dragSeconds_ : 0.0, stats.previews, stats.renders);
}

}  // namespace

void runViewer(const veltrane_cli::Scene& scene, const ViewOptions& options) {
  ViewerWindow window(scene, options);
  window.run();
}

}  // namespace veltrane_viewer
