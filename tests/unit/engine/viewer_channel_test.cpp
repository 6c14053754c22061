// The viewer's events through the engine, as `interact` and `view` deliver them: what each sent
// and changed, and the selection learnt as values.
#include <gtest/gtest.h>

#include "support/engine_fixture.h"

namespace refhost {
namespace {

TEST(ViewerChannel, DragSelectsAndMovesAnInputAsOneUndoStep) {
  auto started = testsupport::startEngine({64, 36, 25.0, 1.0f, 10, ""});
  Engine& engine = *started;
  EXPECT_FALSE(engine.viewerState().selectedInput);

  // Hovering over a region offers to move its picture.
  engine.pointerMove(10, 28, false);
  EXPECT_EQ(engine.cursor(), 3);

  // A press in a region, away from the diagonal cut and its handles, grabs the region's input.
  ViewerOutcome press = engine.pointerPress(10, 28);
  ASSERT_FALSE(press.sent.empty());
  EXPECT_EQ(press.sent.front().message, kMessagePointerPress);
  EXPECT_EQ(press.result, 1);
  ViewerState state = engine.viewerState();
  ASSERT_TRUE(state.selectedInput);
  EXPECT_TRUE(state.pointerOverSelection);
  const std::string translation = "inputFrameTranslation" + std::to_string(*state.selectedInput);

  ViewerOutcome move = engine.pointerMove(16, 25, true);
  EXPECT_EQ(move.changedParams, std::vector<std::string>{translation});
  ASSERT_EQ(move.sent.size(), 2u);  // the move, then the report of what it changed
  EXPECT_EQ(move.sent[1].message, kMessageParameterChanged);
  EXPECT_EQ(move.sent[1].param, translation);
  EXPECT_EQ(engine.valueAt(translation, 0).number[0], 6.0f);
  EXPECT_TRUE(engine.openUndoStep());
  engine.pointerRelease(16, 25);
  EXPECT_FALSE(engine.openUndoStep());
  EXPECT_EQ(engine.undoStepNames().size(), 1u);

  // Undo as a viewer event restores the translation and reports it.
  ViewerOutcome undone = engine.undoSteps(3);
  EXPECT_EQ(undone.result, 1);
  EXPECT_EQ(undone.changedParams, std::vector<std::string>{translation});
  EXPECT_EQ(engine.valueAt(translation, 0).number[0], 0.0f);
  engine.finish();
}

}  // namespace
}  // namespace refhost
