// What the viewer window stands on: GLFW (with the display check), a window with an OpenGL 4.1
// context of the chosen profile, Dear ImGui with its GLFW and OpenGL 3 backends, and the input
// events the window's callbacks queue.
#pragma once

#include <GL/glew.h>
#define GLFW_INCLUDE_NONE
#include <GLFW/glfw3.h>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "refhost/gl/gl_context.h"

namespace veltrane_viewer {

constexpr int kInitialWidth = 1280;
constexpr int kInitialHeight = 800;

// GLFW for as long as the window lives. Throws std::runtime_error when there is no display,
// saying so and suggesting xvfb-run.
class GlfwLibrary {
 public:
  GlfwLibrary();
  ~GlfwLibrary();
  GlfwLibrary(const GlfwLibrary&) = delete;
  GlfwLibrary& operator=(const GlfwLibrary&) = delete;
};

struct WindowDeleter {
  void operator()(GLFWwindow* window) const { glfwDestroyWindow(window); }
};
using WindowHandle = std::unique_ptr<GLFWwindow, WindowDeleter>;

// A hidden window (shown once the scene is up) whose debug context of the profile is current.
WindowHandle createWindow(refhost::GlProfile profile);

// Dear ImGui with its GLFW and OpenGL 3 backends, for as long as the window lives; sizes grow
// with the display's content scale. The backend chains the callbacks installed before it.
class ImGuiRuntime {
 public:
  ImGuiRuntime(GLFWwindow* window, float scale);
  ~ImGuiRuntime();
  ImGuiRuntime(const ImGuiRuntime&) = delete;
  ImGuiRuntime& operator=(const ImGuiRuntime&) = delete;
};

// The dots per inch of the screen the window is on (the primary one), 0 when it does not say.
double screenDotsPerInch();

struct InputEvent {
  enum class Kind { Move, Button, Scroll, Key } kind = Kind::Move;
  double x = 0;  // Move: window position; Scroll: offsets
  double y = 0;
  int code = 0;  // Button: the GLFW button; Key: the GLFW key
  int action = 0;
  int mods = 0;
};

// The X11 keysym the plug-in's key messages carry for the key; 0 for keys it has no use for.
uint32_t keysymFor(int key);

// The items of a popup menu text ('|'-separated; an empty text has none).
std::vector<std::string> menuItems(const std::string& text);

}  // namespace veltrane_viewer
