// What the host records of the plug-in's viewer requests and how it answers them: popup menus,
// cursors, redraws, frame requests and the host's identity.
#include <gtest/gtest.h>

#include "refhost/host.h"
#include "refhost/text.h"

namespace refhost {
namespace {

TEST(HostViewerRecords, PopupMenusAnswerFromTheScriptThenDismiss) {
  Host host;
  host.queuePopupAnswer(2);
  host.queuePopupAnswer(0);
  const char* menus[] = {"A|B|C", "", "Only"};
  std::vector<int32_t> answers;
  for (const char* menu : menus) answers.push_back(host.api().ShowPopupMenu(host.handle(), menu));
  EXPECT_EQ(answers, (std::vector<int32_t>{2, 0, -1}));
  EXPECT_EQ(host.popupMenus(), (std::vector<std::string>{"A|B|C", "", "Only"}));
  EXPECT_EQ(host.callLog()[1], "ShowPopupMenu \"\"");
}

TEST(HostViewerRecords, RecordsCursorsRedrawsAndFrameRequests) {
  Host host;
  tagWispAPI& api = host.api();
  WispHost* h = host.handle();
  const uint32_t frames[] = {12, 12};
  api.SetCursor(h, 3);
  api.SetCursor(h, 0);
  api.Redraw(h, 0);
  api.RequestFrames(h, 2, frames);
  api.RequestLayerFrames(h, "11111111-2222-3333-4444-555555555555", 2, frames);
  EXPECT_EQ(host.cursorShapes(), (std::vector<int32_t>{3, 0}));
  EXPECT_EQ(host.redrawCount(), 1);
  ASSERT_EQ(host.frameRequests().size(), 2u);
  EXPECT_EQ(host.frameRequests()[0].layerGuid, "");
  EXPECT_EQ(host.frameRequests()[1].frames, (std::vector<uint32_t>{12, 12}));
  EXPECT_EQ(
      host.callsTo("RequestLayerFrames"),
      std::vector<std::string>{"RequestLayerFrames 11111111-2222-3333-4444-555555555555 2 12 12"});
  EXPECT_EQ(host.callsTo("RequestFrames"), std::vector<std::string>{"RequestFrames 2 12 12"});
  host.clearViewerRecords();
  EXPECT_TRUE(host.cursorShapes().empty());
  EXPECT_TRUE(host.frameRequests().empty());
}

TEST(HostViewerRecords, ReportsItsConfiguredIdentity) {
  Host host;
  EXPECT_EQ(host.api().GetHostId(host.handle()), 0);
  EXPECT_EQ(toUtf8(host.api().GetHostIdentifier(host.handle())), "org.veltrane.refhost");
  host.setHostId(6001);
  host.setHostIdentifier(L"org.example.édit");
  host.setVerbose(true);
  host.setTextureFormatMode(2);
  EXPECT_EQ(host.api().GetHostId(host.handle()), 6001);
  EXPECT_EQ(toUtf8(host.api().GetHostIdentifier(host.handle())),
            "org.example.\xC3\xA9"
            "dit");
  EXPECT_EQ(host.api().verbose, 1);
  EXPECT_EQ(host.api().textureFormatMode, 2u);
}

}  // namespace
}  // namespace refhost
