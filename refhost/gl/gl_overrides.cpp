// The host's executable defines glGetString, glGetIntegerv and glewInit and exports them, so a
// loaded plug-in binds to these rather than to the driver's; each forwards to the next
// definition in the lookup order (the driver, GLEW) unless an override applies. The indexed
// extension query and the shader compile are GLEW function pointers, shared with the plug-in
// through libGLEW, and are replaced after each glewInit.
#include "refhost/gl/gl_overrides.h"

#include <GL/glew.h>
#include <dlfcn.h>

#include <mutex>
#include <vector>

namespace refhost {
namespace {

struct State {
  std::mutex mutex;
  bool active = false;
  GlOverrides overrides;
  std::vector<std::string> extensions;  // the visible indexed list while active
  PFNGLGETSTRINGIPROC driverGetStringi = nullptr;
  PFNGLCOMPILESHADERPROC driverCompileShader = nullptr;
};

State& state() {
  static State instance;
  return instance;
}

template <typename Function>
Function next(const char* name) {
  return reinterpret_cast<Function>(dlsym(RTLD_NEXT, name));
}

using GetStringFunction = const GLubyte* (*)(GLenum);
using GetIntegervFunction = void (*)(GLenum, GLint*);
using GlewInitFunction = GLenum (*)();

GetStringFunction driverGetString() {
  static GetStringFunction function = next<GetStringFunction>("glGetString");
  return function;
}
GetIntegervFunction driverGetIntegerv() {
  static GetIntegervFunction function = next<GetIntegervFunction>("glGetIntegerv");
  return function;
}

const GLubyte* GLAPIENTRY overriddenGetStringi(GLenum name, GLuint index) {
  State& s = state();
  if (name == GL_EXTENSIONS && s.active) {
    return index < s.extensions.size()
               ? reinterpret_cast<const GLubyte*>(s.extensions[index].c_str())
               : nullptr;
  }
  return s.driverGetStringi ? s.driverGetStringi(name, index) : nullptr;
}

// Builds the visible list from the driver's and points GLEW's indexed query at the override.
void wireExtensionList(State& s) {
  if (glGetStringi && glGetStringi != overriddenGetStringi) s.driverGetStringi = glGetStringi;
  s.extensions.clear();
  if (s.active && s.driverGetStringi) {
    GLint count = 0;
    driverGetIntegerv()(GL_NUM_EXTENSIONS, &count);
    for (GLint i = 0; i < count; ++i) {
      const GLubyte* text = s.driverGetStringi(GL_EXTENSIONS, static_cast<GLuint>(i));
      if (!text) continue;
      std::string extension(reinterpret_cast<const char*>(text));
      if (!s.overrides.hiddenExtensions.count(extension)) s.extensions.push_back(extension);
    }
  }
  if (s.driverGetStringi) glGetStringi = s.active ? overriddenGetStringi : s.driverGetStringi;
}

// Leaves the shader uncompiled, so its compile status stays false as after a compile error.
void GLAPIENTRY refusedCompileShader(GLuint) {}

// Points GLEW's shader compile at the refusing one while refusals are asked for.
void wireShaderCompiler(State& s) {
  if (glCompileShader && glCompileShader != refusedCompileShader)
    s.driverCompileShader = glCompileShader;
  if (s.driverCompileShader)
    glCompileShader =
        s.active && s.overrides.refuseShaderCompiles ? refusedCompileShader : s.driverCompileShader;
}

void wireEntryPoints(State& s) {
  wireExtensionList(s);
  wireShaderCompiler(s);
}

}  // namespace

void setGlOverrides(const GlOverrides& overrides) {
  State& s = state();
  std::lock_guard<std::mutex> lock(s.mutex);
  s.overrides = overrides;
  s.active = true;
  wireEntryPoints(s);
}

void clearGlOverrides() {
  State& s = state();
  std::lock_guard<std::mutex> lock(s.mutex);
  s.overrides = GlOverrides{};
  s.active = false;
  wireEntryPoints(s);
}

}  // namespace refhost

extern "C" {

const GLubyte* GLAPIENTRY glGetString(GLenum name) {
  refhost::State& s = refhost::state();
  if (s.active) {
    if (name == GL_VENDOR && s.overrides.vendor)
      return reinterpret_cast<const GLubyte*>(s.overrides.vendor->c_str());
    if (name == GL_RENDERER && s.overrides.renderer)
      return reinterpret_cast<const GLubyte*>(s.overrides.renderer->c_str());
  }
  return refhost::driverGetString()(name);
}

void GLAPIENTRY glGetIntegerv(GLenum name, GLint* data) {
  refhost::State& s = refhost::state();
  if (name == GL_NUM_EXTENSIONS && s.active && data) {
    *data = static_cast<GLint>(s.extensions.size());
    return;
  }
  refhost::driverGetIntegerv()(name, data);
}

GLenum GLEWAPIENTRY glewInit() {
  static const auto driverGlewInit = refhost::next<refhost::GlewInitFunction>("glewInit");
  const GLenum result = driverGlewInit();
  refhost::State& s = refhost::state();
  std::lock_guard<std::mutex> lock(s.mutex);
  // GLEW has just reloaded its pointers from the driver.
  s.driverGetStringi = nullptr;
  s.driverCompileShader = nullptr;
  refhost::wireEntryPoints(s);
  return result;
}

}  // extern "C"
