// The bridge's renders in this process: the application's GL context survives them, each
// calling thread gets a context of its own, and a picture smaller than the composition (an
// editor's preview) shows the composition's layout scaled down.
#include "effect_service.h"

#include <EGL/egl.h>
#include <gtest/gtest.h>

#include <map>
#include <thread>

#include "current_context.h"
#include "refhost/gl/headless_context.h"

namespace veltrane_mlt {
namespace {

// A picture with left half red and right half blue, opaque.
std::vector<uint8_t> halves(int width, int height) {
  std::vector<uint8_t> pixels(std::size_t(width) * height * 4);
  for (int i = 0; i < width * height; ++i) {
    const bool left = i % width < width / 2;
    pixels[i * 4] = left ? 255 : 0;
    pixels[i * 4 + 2] = left ? 0 : 255;
    pixels[i * 4 + 3] = 255;
  }
  return pixels;
}

using Properties = std::map<std::string, std::string>;

// The filter with the properties, rendering `picture` for a composition of the given size.
class Filter {
 public:
  explicit Filter(const Properties& properties) : filter_(mlt_filter_new()) {
    mlt_properties_set(MLT_FILTER_PROPERTIES(filter_), kModuleProperty, VELTRANE_MODULE_PATH);
    for (const auto& [name, value] : properties)
      mlt_properties_set(MLT_FILTER_PROPERTIES(filter_), name.c_str(), value.c_str());
    effect_ = std::make_unique<EffectService>(MLT_FILTER_SERVICE(filter_), "the picture");
  }
  ~Filter() {
    effect_.reset();
    mlt_filter_close(filter_);
  }

  std::vector<uint8_t> render(const std::vector<uint8_t>& picture, int width, int height,
                              int compositionWidth, int compositionHeight) {
    RenderRequest request;
    request.width = width;
    request.height = height;
    request.compositionWidth = compositionWidth;
    request.compositionHeight = compositionHeight;
    request.own.current = picture.data();
    std::vector<uint8_t> out(picture.size());
    EXPECT_TRUE(effect_->render(0, 1, tractorResolver(nullptr, -1), request, out.data()));
    return out;
  }

 private:
  mlt_filter filter_;
  std::unique_ptr<EffectService> effect_;
};

TEST(EffectService, GivesBackTheApplicationsContextAfterEveryRender) {
  // The application's context, made as an editor would make one; without GL this fails here.
  std::unique_ptr<refhost::GlContext> application =
      refhost::makeHeadlessContext(refhost::GlProfile::Core);
  application->makeCurrent();
  const EGLContext before = eglGetCurrentContext();
  ASSERT_NE(before, EGL_NO_CONTEXT);
  {
    // Both regions the own picture and no border: the effect gives its source back, at any
    // size MLT hands over (odd widths, a single pixel, a tall strip).
    Filter filter(Properties{{"borderWidth", "0"}});
    for (auto [width, height] : {std::pair{64, 36}, {1, 1}, {7, 3}, {333, 17}, {3, 101}}) {
      SCOPED_TRACE(std::to_string(width) + "x" + std::to_string(height));
      const std::vector<uint8_t> sized = halves(width, height);
      EXPECT_EQ(filter.render(sized, width, height, width, height), sized);
      EXPECT_EQ(eglGetCurrentContext(), before);
    }
    const std::vector<uint8_t> picture = halves(64, 36);

    // Another thread, with nothing current, gets a context of its own and is left with none.
    std::vector<uint8_t> fromThread;
    EGLContext afterThread = before;
    std::thread([&] {
      fromThread = filter.render(picture, 64, 36, 64, 36);
      afterThread = eglGetCurrentContext();
    }).join();
    EXPECT_EQ(fromThread, picture);
    EXPECT_EQ(afterThread, EGL_NO_CONTEXT);
    EXPECT_EQ(eglGetCurrentContext(), before);
  }
  EXPECT_EQ(eglGetCurrentContext(), before);  // closing the service gave it back too
}

TEST(EffectService, RendersASmallerPictureAsTheCompositionScaledDown) {
  // The same layout twice: measured for a 64x36 composition, and for a 128x72 one whose
  // picture arrives at 64x36. Every value in pixels scales with the picture.
  const std::vector<uint8_t> picture = halves(64, 36);
  Filter full(Properties{{"cutPosition_0", "6 -4"},
                         {"cutDirection_0", "70"},
                         {"borderWidth", "3"},
                         {"borderColor", "#ffffff"},
                         {"inputFrameTranslation1", "10 0"}});
  Filter preview(Properties{{"cutPosition_0", "12 -8"},
                            {"cutDirection_0", "70"},
                            {"borderWidth", "6"},
                            {"borderColor", "#ffffff"},
                            {"inputFrameTranslation1", "20 0"}});
  const std::vector<uint8_t> expected = full.render(picture, 64, 36, 64, 36);
  const std::vector<uint8_t> scaled = preview.render(picture, 64, 36, 128, 72);
  ASSERT_EQ(scaled.size(), expected.size());
  int largest = 0, white = 0;
  for (std::size_t i = 0; i < expected.size(); ++i) {
    largest = std::max(largest, std::abs(int(expected[i]) - int(scaled[i])));
    white += i % 4 == 1 && expected[i] == 255;  // green only in the border
  }
  EXPECT_LE(largest, 2);
  EXPECT_GT(white, 36);  // the border is there to be compared
}

}  // namespace
}  // namespace veltrane_mlt
