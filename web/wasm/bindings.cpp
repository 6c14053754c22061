// What the page's script sees of the WebAssembly: the canvas's context made current and one
// PageSession over it.
#include <emscripten/bind.h>
#include <emscripten/html5.h>

#include <stdexcept>
#include <string>

#include "browser_media.h"
#include "page_session.h"

namespace veltrane_web {
namespace {

// Makes a WebGL 2 context on the canvas the selector names and makes it current. Without
// antialiasing, so that the picture can be copied onto the canvas by a framebuffer blit; kept
// after each frame, so that a screenshot finds what was last shown.
void attachCanvas(const std::string& selector) {
  EmscriptenWebGLContextAttributes attributes;
  emscripten_webgl_init_context_attributes(&attributes);
  attributes.majorVersion = 2;
  attributes.minorVersion = 0;
  attributes.alpha = false;
  attributes.depth = false;
  attributes.stencil = false;
  attributes.antialias = false;
  attributes.preserveDrawingBuffer = true;
  attributes.enableExtensionsByDefault = true;
  const EMSCRIPTEN_WEBGL_CONTEXT_HANDLE context =
      emscripten_webgl_create_context(selector.c_str(), &attributes);
  if (context <= 0 || emscripten_webgl_make_context_current(context) != EMSCRIPTEN_RESULT_SUCCESS)
    throw std::runtime_error("this browser gives the page no WebGL 2 context");
}

emscripten::val readPicture(PageSession& session) {
  const std::vector<uint8_t>& pixels = session.readPicture();
  return emscripten::val(emscripten::typed_memory_view(pixels.size(), pixels.data()));
}

// A clip's rate as a scene writes it ("25", "30000/1001"), from the rate the browser measured.
std::string clipRateText(double perSecond) { return clipRate(perSecond).text(); }

}  // namespace

EMSCRIPTEN_BINDINGS(veltrane_page) {
  emscripten::function("attachCanvas", &attachCanvas);
  emscripten::function("clipRateText", &clipRateText);
  emscripten::class_<PageSession>("PageSession")
      .constructor<>()
      .function("open", &PageSession::open)
      .function("isOpen", &PageSession::isOpen)
      .function("describe", &PageSession::describe)
      .function("state", &PageSession::state)
      .function("frame", &PageSession::frame)
      .function("setFrame", &PageSession::setFrame)
      .function("edit", &PageSession::edit)
      .function("finishEdit", &PageSession::finishEdit)
      .function("toggleKey", &PageSession::toggleKey)
      .function("applyLayout", &PageSession::applyLayout)
      .function("fitPictures", &PageSession::fitPictures)
      .function("undo", &PageSession::undo)
      .function("redo", &PageSession::redo)
      .function("setCanvasSize", &PageSession::setCanvasSize)
      .function("pointer", &PageSession::pointer)
      .function("key", &PageSession::key)
      .function("render", &PageSession::render)
      .function("present", &PageSession::present)
      .function("readPicture", &readPicture)
      .function("pictureWidth", &PageSession::pictureWidth)
      .function("pictureHeight", &PageSession::pictureHeight)
      .function("save", &PageSession::save);
}

}  // namespace veltrane_web
