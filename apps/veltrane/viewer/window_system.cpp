// GLFW and Dear ImGui set-up, and the key and menu translations of the viewer window.
#include "viewer/window_system.h"

#include <imgui.h>
#include <imgui_impl_glfw.h>
#include <imgui_impl_opengl3.h>

#include <cstdlib>
#include <stdexcept>

#include "host/wisp_protocol.h"

namespace veltrane_viewer {
namespace {

// The right Shift's X11 keysym; the plug-in reacts to the left one and Escape (WispKey) only.
constexpr uint32_t kShiftRight = 65506;

std::string glfwErrorText() {
  const char* description = nullptr;
  glfwGetError(&description);
  return description ? description : "unknown error";
}

bool isSet(const char* variable) {
  const char* value = std::getenv(variable);
  return value && *value;
}

}  // namespace

GlfwLibrary::GlfwLibrary() {
  if (!isSet("DISPLAY") && !isSet("WAYLAND_DISPLAY"))
    throw std::runtime_error(
        "cannot open a window: no display (DISPLAY is not set); run it under a virtual X "
        "server, e.g. xvfb-run -a veltrane view SCENE.json");
  if (!glfwInit())
    throw std::runtime_error("cannot open a window: " + glfwErrorText() +
                             " (without a reachable display, run it under xvfb-run -a)");
}

// Under AddressSanitizer the display stays open until the process ends: closing it unloads the
// GL driver, whose remaining allocations LeakSanitizer would then report as leaks.
GlfwLibrary::~GlfwLibrary() {
#ifndef __SANITIZE_ADDRESS__
  glfwTerminate();
#endif
}

WindowHandle createWindow(refhost::GlProfile profile) {
  glfwWindowHint(GLFW_CONTEXT_VERSION_MAJOR, 4);
  glfwWindowHint(GLFW_CONTEXT_VERSION_MINOR, 1);
  glfwWindowHint(GLFW_OPENGL_PROFILE, profile == refhost::GlProfile::Core
                                          ? GLFW_OPENGL_CORE_PROFILE
                                          : GLFW_OPENGL_COMPAT_PROFILE);
  glfwWindowHint(GLFW_OPENGL_DEBUG_CONTEXT, GLFW_TRUE);
  glfwWindowHint(GLFW_SCALE_TO_MONITOR, GLFW_TRUE);
  glfwWindowHint(GLFW_VISIBLE, GLFW_FALSE);  // shown once the scene is up
  GLFWwindow* window =
      glfwCreateWindow(kInitialWidth, kInitialHeight, "veltrane view", nullptr, nullptr);
  if (!window)
    throw std::runtime_error("cannot open a window with an OpenGL 4.1 context: " + glfwErrorText());
  glfwMakeContextCurrent(window);
  glfwSwapInterval(1);
  return WindowHandle(window);
}

ImGuiRuntime::ImGuiRuntime(GLFWwindow* window, float scale) {
  ImGui::CreateContext();
  ImGuiIO& io = ImGui::GetIO();
  io.IniFilename = nullptr;  // the viewer keeps no files of its own
  io.FontGlobalScale = scale;
  ImGui::StyleColorsDark();
  ImGui::GetStyle().ScaleAllSizes(scale);
  ImGui_ImplGlfw_InitForOpenGL(window, true);  // chains the viewer's own callbacks
  ImGui_ImplOpenGL3_Init("#version 410");
}

ImGuiRuntime::~ImGuiRuntime() {
  ImGui_ImplOpenGL3_Shutdown();
  ImGui_ImplGlfw_Shutdown();
  ImGui::DestroyContext();
}

double screenDotsPerInch() {
  GLFWmonitor* monitor = glfwGetPrimaryMonitor();
  const GLFWvidmode* mode = monitor ? glfwGetVideoMode(monitor) : nullptr;
  int widthMillimetres = 0, heightMillimetres = 0;
  if (monitor) glfwGetMonitorPhysicalSize(monitor, &widthMillimetres, &heightMillimetres);
  if (!mode || widthMillimetres <= 0) return 0;
  return mode->width * 25.4 / widthMillimetres;
}

uint32_t keysymFor(int key) {
  switch (key) {
    case GLFW_KEY_LEFT_SHIFT:
      return kKeyLeftShift;
    case GLFW_KEY_RIGHT_SHIFT:
      return kShiftRight;
    case GLFW_KEY_ESCAPE:
      return kKeyEscape;
    default:
      return 0;  // no other key means anything to the plug-in
  }
}

std::vector<std::string> menuItems(const std::string& text) {
  std::vector<std::string> items;
  std::size_t start = 0;
  for (std::size_t bar = text.find('|'); bar != std::string::npos; bar = text.find('|', start)) {
    items.push_back(text.substr(start, bar - start));
    start = bar + 1;
  }
  items.push_back(text.substr(start));
  if (text.empty()) items.clear();
  return items;
}

}  // namespace veltrane_viewer
