// Frame 40 of the demo scene as the Windows build renders it under wine, against the Linux
// build's render of the same frame (both written by the DemoFrame render tests).
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>

#include "refhost/media/image_files.h"

namespace {

TEST(DemoFrame, WindowsRenderMatchesLinuxRender) {
  const auto fromLinux = refhost::readImageFile(VELTRANE_DEMO_FRAMES_DIR "/linux.png");
  const auto fromWindows = refhost::readImageFile(VELTRANE_DEMO_FRAMES_DIR "/windows.png");
  ASSERT_EQ(fromLinux.width, fromWindows.width);
  ASSERT_EQ(fromLinux.height, fromWindows.height);
  int largest = 0;
  for (std::size_t i = 0; i < fromLinux.pixels.size(); ++i)
    largest = std::max(largest, std::abs(fromLinux.pixels[i] - fromWindows.pixels[i]));
  EXPECT_LE(largest, 1) << "largest channel difference out of 255";
}

}  // namespace
