// Which picture each input shows and who gives its texture back: the own source borrowed,
// shifted source frames and layer frames owned, transparent black where nothing can be had.
#include <climits>

#include "render_fixture.h"
#include "support/instrumented_host.h"

namespace {

using InputCapture = RenderTest;

using refhost::ParamValue;

const std::string kLayer = "22222222-0000-4000-8000-000000000002";

// One vertical cut through the centre: input 1 on the left, input 0 on the right.
void splitDownTheMiddle(testsupport::InstrumentedHost& host) {
  setCut(host, 0, 0.0f, 0.0f, 0.0f);
  host.setValue("borderWidth", ParamValue::ofFloat(0.0f));
}

size_t calls(testsupport::InstrumentedHost& host, const char* operation) {
  return host.callsTo(operation).size();
}

TEST_F(InputCapture, OwnSourceIsBorrowedAndFetchedFramesAreGivenBack) {
  splitDownTheMiddle(host());
  host().clearCallLog();
  render(kRed);
  // Only the two render targets are allocated and released; the source is never fetched.
  EXPECT_EQ(calls(host(), "AllocateTexture"), 2u);
  EXPECT_EQ(calls(host(), "ReleaseTexture"), 2u);
  EXPECT_EQ(calls(host(), "GetSourceFrame"), 0u);

  host().setValue("inputFrameShift1", ParamValue::ofInt(2));
  host().clearCallLog();
  render(kRed);
  EXPECT_EQ(calls(host(), "GetSourceFrame"), 1u);
  EXPECT_EQ(calls(host(), "ReleaseTexture"), 3u);  // the shifted frame went back too
  EXPECT_EQ(host().outstandingFrames(), 0);
}

TEST_F(InputCapture, UndeliverableLayersFallBackAsTheHostAllows) {
  splitDownTheMiddle(host());
  addSolidLayer(kLayer, kGreen);

  const struct {
    const char* name;
    std::string guid;
    bool refuseFrames;
    Rgba left;
  } table[] = {
      {"delivered", kLayer, false, kGreen},
      {"unknown layer: the own source", "99999999-0000-4000-8000-000000000009", false, kRed},
      {"refused frame: transparent", kLayer, true, kClear}};
  for (const auto& row : table) {
    SCOPED_TRACE(row.name);
    host().setValue("inputLayer1", ParamValue::ofLayer(row.guid));
    host().faults().refuseLayerFrames = row.refuseFrames;
    const std::vector<uint8_t> pixels = render(kRed);
    EXPECT_EQ(pixel(pixels, 8, 18), row.left);
    EXPECT_EQ(pixel(pixels, 56, 18), kRed);
  }
}

TEST_F(InputCapture, LayerFramesOutsideTheLayerAreTransparent) {
  splitDownTheMiddle(host());
  addSolidLayer(kLayer, kGreen, /*firstFrame=*/12, /*frameCount=*/5);
  host().setValue("inputLayer1", ParamValue::ofLayer(kLayer));
  const struct {
    int32_t frame;
    int32_t shift;
    Rgba left;
  } table[] = {{10, 0, kClear}, {12, 0, kGreen}, {10, 2, kGreen},         {16, 0, kGreen},
               {17, 0, kClear}, {16, 1, kClear}, {10, INT32_MAX, kClear}, {10, INT32_MIN, kClear}};
  for (const auto& row : table) {
    SCOPED_TRACE(std::to_string(row.frame) + " shift " + std::to_string(row.shift));
    host().setValue("inputFrameShift1", ParamValue::ofInt(row.shift));
    const std::vector<uint8_t> pixels = render(kRed, row.frame);
    EXPECT_EQ(pixel(pixels, 8, 18), row.left);
  }
}

TEST_F(InputCapture, LayersAreAlignedOnlyWhenTheirPlacementDiffers) {
  splitDownTheMiddle(host());
  addSolidLayer(kLayer, kGreen);
  host().setValue("inputLayer1", ParamValue::ofLayer(kLayer));

  host().clearCallLog();
  render(kRed);
  EXPECT_EQ(calls(host(), "AllocateTexture"), 2u);  // same size and placement: used as it is

  // Half the size of the frame, both placed at the composition's origin: the layer is
  // re-rendered into a texture of the output's size, covering its lower-left quarter.
  host().layers().back().width = RenderFixture::kWidth / 2;
  host().layers().back().height = RenderFixture::kHeight / 2;
  host().clearCallLog();
  const std::vector<uint8_t> pixels = render(kRed);
  EXPECT_EQ(calls(host(), "AllocateTexture"), 3u);
  EXPECT_EQ(calls(host(), "ReleaseTexture"), 4u);  // both targets, the aligned copy, the frame
  EXPECT_EQ(pixel(pixels, 0, 0), kGreen);          // its first and last rows and columns
  EXPECT_EQ(pixel(pixels, 31, 17), kGreen);
  EXPECT_EQ(pixel(pixels, 8, 30), kClear);  // above it, still in input 1's region
  EXPECT_EQ(pixel(pixels, 56, 30), kRed);

  // The same layer in 3D, exactly where the flat one sits once taken into camera space (the
  // lens distance, 1000 * H / 720 pixels in front of the camera), looks the same.
  host().layers().back().is3D = true;
  host().layers().back().placement[14] = -1000.0f * RenderFixture::kHeight / 720.0f;
  EXPECT_EQ(render(kRed), pixels);
}

}  // namespace
