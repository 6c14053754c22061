// Reading cuts from parameters: clamping, angle wrapping, pixel aspect, ordering and repeats.
// (That wrapping any angle takes bounded time shows in the geometry fuzzer.)
#include "geometry/cut_model.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <utility>
#include <vector>

#include "common/param_ids.h"
#include "geometry/angles.h"
#include "support/in_memory_host.h"

namespace veltrane {
namespace {

constexpr float kInfinity = std::numeric_limits<float>::infinity();
constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
const plugin_glsl_types::genVec2 kHd{1920.0f, 1080.0f};

class CutModel : public ::testing::Test {
 protected:
  Cut read(int index, plugin_glsl_types::genVec2 frame = kHd, bool aspectPresent = false,
           float aspect = 1.0f) {
    return readCut(host.handle(), host.record(), index, 0, frame, aspectPresent, aspect);
  }
  std::vector<int> readNumbers() {
    std::vector<int> numbers;
    for (const Cut& cut : readCutList(host.handle(), host.record(), 0, kHd, false, 1.0f)) {
      numbers.push_back(cut.cutNumber);
    }
    return numbers;
  }
  void addCut(int index, float x, float y, float degrees) {
    host.setPoint(cutParamId(param::kCutPositionPrefix, index), x, y);
    host.set(cutParamId(param::kCutDirectionPrefix, index), degrees);
  }
  testsupport::InMemoryHost host;
};

TEST_F(CutModel, ClampsPositionOnePixelInsideTheFrame) {
  const struct {
    float x, y, width, height, expectX, expectY;
  } cases[] = {
      {5000, -5000, 1920, 1080, 959, -539},
      {12.5f, -7.25f, 1920, 1080, 12.5f, -7.25f},
      // Under two pixels the lower bound is tested first, so the upper bound wins otherwise.
      {0.7f, 0.2f, 1, 1, -0.5f, 0.5f},
      {5, 5, 0, 0, -1, -1},
      {kNaN, kNaN, 1920, 1080, 959, 539},
      {kInfinity, -kInfinity, 1920, 1080, 959, -539},
  };
  for (const auto& c : cases) {
    addCut(0, c.x, c.y, 0);
    const Cut cut = read(0, {c.width, c.height});
    EXPECT_EQ(cut.positionX, c.expectX) << c.x << " in " << c.width;
    EXPECT_EQ(cut.positionY, c.expectY) << c.y << " in " << c.height;
  }
}

TEST_F(CutModel, WrapsDirectionIntoHalfTurnEitherWay) {
  const struct {
    float degrees, angle, directionX, directionY;
  } cases[] = {{0, 0, 0, 1},        {90, kHalfPi, 1, 0},
               {540, kPi, 0, -1},   {-190, 170 * kPi / 180, 0.17364818f, -0.98480775f},
               {-180, -kPi, 0, -1}, {3 * 360 + 45, 45 * kPi / 180, 0.70710677f, 0.70710677f}};
  for (const auto& c : cases) {
    addCut(0, 0, 0, c.degrees);
    const Cut cut = read(0);
    EXPECT_NEAR(cut.angle, c.angle, 2e-6f) << c.degrees;
    EXPECT_NEAR(cut.directionX, c.directionX, 1e-6f) << c.degrees;
    EXPECT_NEAR(cut.directionY, c.directionY, 1e-6f) << c.degrees;
  }
}

TEST(Angles, WrapIntoRangeKeepsBothEndsOfTheRange) {
  const struct {
    float alpha, start, end, wrapped;
  } cases[] = {{1, -1, 1, 1},
               {-1, -1, 1, -1},
               {1 + kTwoPi, -1, 1, 1},
               {-1 - 2 * kTwoPi, -1, 1, -1},
               {0.5f, 4, 7, 0.5f + kTwoPi},
               {kPi, -kPi, kPi, kPi}};
  for (const auto& c : cases)
    EXPECT_NEAR(wrapIntoRange(c.alpha, c.start, c.end), c.wrapped, 1e-5f) << c.alpha;
  // Some 4,800 turns away: more than the turns taken one by one.
  EXPECT_LE(std::fabs(wrapIntoRange(3e4f, -kPi, kPi)), kPi);
}

TEST_F(CutModel, PixelAspectStretchesPositionAndDirection) {
  addCut(2, 300, 10, 45);
  const Cut cut = read(2, kHd, true, 2.0f);
  EXPECT_EQ(cut.positionX, 600);
  EXPECT_NEAR(cut.directionX, 2 / std::sqrt(5.0f), 1e-6f);
  EXPECT_NEAR(cut.directionY, 1 / std::sqrt(5.0f), 1e-6f);
  addCut(2, 700, 10, 45);
  EXPECT_EQ(read(2, kHd, true, 2.0f).positionX, 959);   // stretched, then clamped
  EXPECT_EQ(read(2, kHd, false, 2.0f).positionX, 700);  // the factor needs its flag
}

TEST_F(CutModel, RadialCutsShareTheGlobalPositionButKeepTheirDirection) {
  host.setInt(param::kCutType, kCutTypeRadial);
  host.setPoint(param::kCutPositionGlobal, -20, 30);
  addCut(1, 400, 400, 90);
  const Cut cut = read(1);
  EXPECT_EQ(cut.radial, 1);
  EXPECT_EQ(cut.positionX, -20);
  EXPECT_NEAR(cut.angle, kHalfPi, 1e-7f);
  EXPECT_EQ(cut.cutNumber, 2);
}

TEST_F(CutModel, ListKeepsAtMostEightCutsAndDropsRepeatsThatSortTogether) {
  for (int i = 0; i < kMaxCuts; ++i) addCut(i, 10.0f * i, 0, 10.0f * i);
  const std::pair<int, std::size_t> counts[] = {{-3, 0}, {0, 0}, {8, 8}, {99, 8}};
  for (const auto& [count, expected] : counts) {
    host.setInt(param::kNumberOfCuts, count);
    EXPECT_EQ(readNumbers().size(), expected) << count;
  }

  host.setInt(param::kNumberOfCuts, 3);
  const struct {
    const char* what;
    bool radial;
    float x[3], degrees[3];
    std::vector<int> kept;
  } cases[] = {
      {"local, equal angle, repeat not adjacent", false, {5, 9, 5}, {10, 10, 10}, {1, 2, 3}},
      {"local, equal angle, adjacent repeat", false, {5, 5, 9}, {10, 10, 10}, {1, 3}},
      {"local, repeat brought together by angle", false, {5, 9, 5}, {10, 20, 10}, {1, 2}},
      {"radial, same direction", true, {0, 0, 0}, {30, 30, -60}, {1, 3}},
      {"NaN never repeats", false, {5, 5, 5}, {kNaN, kNaN, kNaN}, {1, 2, 3}}};
  for (const auto& c : cases) {
    host.setInt(param::kCutType, c.radial ? kCutTypeRadial : 0);
    for (int i = 0; i < 3; ++i) addCut(i, c.x[i], 0, c.degrees[i]);
    EXPECT_EQ(readNumbers(), c.kept) << c.what;
  }
  Cut radial;
  radial.radial = 1;
  EXPECT_EQ(removeRepeatedCuts({Cut{}, radial}).size(), 2u);  // types never repeat each other
}

}  // namespace
}  // namespace veltrane
