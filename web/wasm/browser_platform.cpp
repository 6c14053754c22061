// The page's side of the host's platform seams: a page has no threads to decode ahead on and
// no headless GL context, only its canvas's. Frames are asked of the media as the render needs
// them (the page prepares them before it renders, see web/src/media.js).
#include <GL/glew.h>

#include <stdexcept>

#include "refhost/gl/headless_context.h"
#include "refhost/pipeline/frame_prefetch.h"

namespace refhost {

std::unique_ptr<GlContext> makeHeadlessContext(GlProfile) {
  throw std::runtime_error("a page draws in its canvas's WebGL 2 context; it has no other");
}

bool DecodeAheadBudget::take(std::size_t bytes) {
  if (used_ + bytes > capacity_) return false;
  used_ += bytes;
  return true;
}

void DecodeAheadBudget::giveBack(std::size_t bytes) { used_ -= bytes < used_ ? bytes : used_; }

std::size_t DecodeAheadBudget::inUse() const { return used_; }

// Nothing waits: every frame comes straight from the wrapped source when it is asked for.
PrefetchingSource::PrefetchingSource(std::shared_ptr<MediaSource> inner, int32_t depth,
                                     std::shared_ptr<DecodeAheadBudget> budget)
    : inner_(std::move(inner)),
      depth_(depth),
      budget_(std::move(budget)),
      frameCount_(inner_->frameCount()),
      info_(inner_->info()) {}

PrefetchingSource::~PrefetchingSource() = default;

std::vector<uint8_t> PrefetchingSource::glRows(int32_t index, int32_t width, int32_t height,
                                               PixelFormat format) {
  return inner_->glRows(index, width, height, format);
}

}  // namespace refhost

// Entry points WebGL 2 lacks, which the module and the host name but never call there: no
// extension offers primitive restart at index 0 and no context offers debug output, so both
// take the paths that do without.
extern "C" {
void glPrimitiveRestartIndex(GLuint) {}
void glDebugMessageCallback(GLDEBUGPROC, const void*) {}
}
