// A context of the host's own, made by the platform without any window the user sees: EGL
// without a display on Linux (the device platform where a GPU is present, Mesa's surfaceless
// platform otherwise), WGL on a hidden window on Windows.
#pragma once

#include <memory>

#include "refhost/gl/gl_context.h"

namespace refhost {

// Makes a 4.1+ debug context of the profile and makes it current. Throws std::runtime_error
// naming the step that failed when none can be made.
std::unique_ptr<GlContext> makeHeadlessContext(GlProfile profile = GlProfile::Core);

}  // namespace refhost
