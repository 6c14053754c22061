// The module as a host sees it: its exports, its registration and the result of every message.
#include <climits>
#include <cwchar>
#include <vector>

#include "loaded_plugin.h"
#include "support/files.h"

namespace {

// The Windows build reads its DLL's export table on the build machine instead.
#ifndef _WIN32
TEST(ModuleExports, ExportsExactlyPluginInfoAndNotify) {
  EXPECT_EQ(testsupport::commandOutput("nm -D --defined-only --format=just-symbols '" +
                                       std::string(VELTRANE_MODULE_PATH) + "'"),
            "Notify\nPluginInfo\n");
}
#endif

TEST(Registration, FieldsAreWrittenAgainAlikeAndANullIdentifierIsSkipped) {
  refhost::Module module(VELTRANE_MODULE_PATH);
  const refhost::Registration first = module.readRegistration();
  EXPECT_EQ(first.kind, 0u);
  EXPECT_EQ(first.name, "Veltrane {split-screen}");
  EXPECT_EQ(first.category, "Generate");
  EXPECT_EQ(first.vendor, "Tavrix");
  EXPECT_FALSE(first.notice.empty());
  EXPECT_EQ(first.version, (std::array<uint32_t, 4>{1, 2, 0, 0}));
  EXPECT_EQ(first.capabilityFlags, 69u);
  EXPECT_EQ(first.interfaceWord, 144585159u);
  EXPECT_EQ(first.interfaceRevision, 5u);
  EXPECT_EQ(first.identifier, "com.tavrix.wisp.veltrane");
  EXPECT_NE(first.guid, (std::array<uint8_t, 16>{}));
  EXPECT_EQ(module.readRegistration().guid, first.guid);

  std::vector<wchar_t> name(kRegistrationNameChars, L'x'), category(kRegistrationCategoryChars),
      vendor(kRegistrationVendorChars), notice(kRegistrationNoticeChars);
  PluginRegistration record{};
  record.name = name.data();
  record.category = category.data();
  record.vendor = vendor.data();
  record.notice = notice.data();
  record.identifier = nullptr;
  module.fillRegistration(&record);
  EXPECT_STREQ(record.name, L"Veltrane {split-screen}");
  // The bounded copy zero-fills the rest of the buffer.
  EXPECT_EQ(name.back(), L'\0');
  EXPECT_STREQ(record.vendor, L"Tavrix");
  EXPECT_EQ(record.identifier, nullptr);
}

// Messages that need neither GL nor a pointer event, with the result each must give.
TEST_F(LoadedPlugin, MessageResultTable) {
  WispRenderContext renderContext{};
  host().setRenderContext(&renderContext);
  // A press without a pointer event has nothing to read.
  const std::pair<int32_t, int32_t> table[] = {
      {kMessageRequestFrames, kResultDone},   {kMessageViewerOpened, kResultDone},
      {kMessageViewerClosed, kResultDone},    {kMessagePointerEntered, kResultNotDone},
      {kMessagePointerLeft, kResultNotDone},  {kMessageDoubleClick, kResultNotDone},
      {kMessagePointerPress, kResultNotDone}, {kMessagePointerOverSelection, kResultNotDone}};
  for (const auto& [message, expected] : table) {
    EXPECT_EQ(host().send(message), expected) << wispMessageText(message);
    EXPECT_EQ(host().messageHistory().back().result, expected) << "as the host recorded";
  }
  EXPECT_EQ(sendParamEvent(kMessageParameterChanged, "borderWidth"), 1);
  EXPECT_EQ(sendParamEvent(kMessageParameterEditBegan, "borderWidth"), 1);
  EXPECT_EQ(sendParamEvent(kMessageParameterEditEnded, "cutType"), 1);

  WispKeyEvent otherKey{97};
  host().setEvent(&otherKey);
  EXPECT_EQ(host().send(kMessageKeyDown), 0);
  EXPECT_EQ(host().send(kMessageKeyUp), 0);
  host().setEvent(nullptr);

  // Nothing selected: the layer picker declines, and a copy from no record changes nothing.
  WispLayerPickerContext picker{"11111111-1111-1111-1111-111111111111"};
  host().setRenderContext(&picker);
  EXPECT_EQ(host().send(kMessagePickLayer), 0);
  host().setRenderContext(nullptr);
  EXPECT_EQ(host().send(kMessageCopyInstance), 0);
  EXPECT_TRUE(host().problems().empty());
}

TEST_F(LoadedPlugin, DestroyAndUnloadTolerateEmptySlots) {
  EXPECT_EQ(host().send(kMessageDestroyInstance), 1);
  EXPECT_EQ(host().api().instanceData, nullptr);
  EXPECT_EQ(host().send(kMessageDestroyInstance), 1);
  EXPECT_EQ(host().send(kMessageUnload), 1);
  EXPECT_EQ(host().api().pluginData, nullptr);
  EXPECT_EQ(host().send(kMessageUnload), 1);
  // Reload so that the fixture's own tear-down finds a plug-in to unload.
  EXPECT_EQ(host().send(kMessageLoad), 1);
  EXPECT_NE(host().api().pluginData, nullptr);
}

// The protocol's message table and the dispatch agree: a number the table does not name is not
// handled, and the host hears nothing of it.
TEST_F(LoadedPlugin, UnnamedMessagesAnswerNotHandledWithoutCallingTheHost) {
  std::vector<int32_t> messages = {INT_MIN, INT_MAX};
  for (int32_t message = -10; message <= 1100; ++message)
    if (!wispMessageName(message)) messages.push_back(message);
  ASSERT_GT(messages.size(), 1000u);
  void* const instance = host().api().instanceData;
  void* const plugin = host().api().pluginData;
  for (const int32_t message : messages)
    ASSERT_EQ(host().send(message), kResultNotHandled) << message;
  EXPECT_TRUE(host().callLog().empty()) << host().callLog().front();
  EXPECT_EQ(host().api().instanceData, instance);
  EXPECT_EQ(host().api().pluginData, plugin);
}

}  // namespace
