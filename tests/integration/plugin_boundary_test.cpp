// The module as a host sees it: its exports, its registration and the result of every message.
#include <climits>
#include <cstdio>
#include <cwchar>
#include <set>
#include <vector>

#include "loaded_plugin.h"

namespace {

// The Windows build reads its DLL's export table on the build machine instead.
#ifndef _WIN32
std::set<std::string> exportedSymbols(const std::string& path) {
  std::set<std::string> names;
  const std::string command = "nm -D --defined-only '" + path + "'";
  FILE* pipe = popen(command.c_str(), "r");
  if (!pipe) return names;
  char line[512];
  while (std::fgets(line, sizeof line, pipe)) {
    char address[64], type[8], name[400];
    if (std::sscanf(line, "%63s %7s %399s", address, type, name) == 3) names.insert(name);
  }
  pclose(pipe);
  return names;
}

TEST(ModuleExports, ExportsExactlyPluginInfoAndNotify) {
  EXPECT_EQ(exportedSymbols(VELTRANE_MODULE_PATH), (std::set<std::string>{"Notify", "PluginInfo"}));
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
  const struct {
    int32_t message;
    int32_t expected;
  } table[] = {
      {5, 2},    {6, 2},  {9, 2},    {11, 2},   {15, 2},   {101, 2},  {999, 2},  {1000, 2},
      {1015, 2}, {12, 1}, {1001, 1}, {1002, 1}, {1009, 0}, {1010, 0}, {1011, 0}, {1012, 0},
  };
  for (const auto& row : table) {
    EXPECT_EQ(host().send(row.message), row.expected) << "message " << row.message;
    EXPECT_EQ(host().messageHistory().back().result, row.expected) << "as the host recorded";
  }
  EXPECT_EQ(sendParamEvent(kMessageParameterChanged, "borderWidth"), 1);
  EXPECT_EQ(sendParamEvent(13, "borderWidth"), 1);
  EXPECT_EQ(sendParamEvent(14, "cutType"), 1);

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

TEST_F(LoadedPlugin, UnlistedMessagesAnswerTwoWithoutCallingTheHost) {
  const std::set<int32_t> listed = {0,    1,    2,    3,    4,    7,    8,    10,   12,
                                    13,   14,   1001, 1002, 1003, 1004, 1005, 1006, 1007,
                                    1008, 1009, 1010, 1011, 1012, 1013, 1014};
  std::vector<int32_t> messages = {INT_MIN, INT_MAX};
  for (int32_t message = -10; message <= 1100; ++message)
    if (!listed.count(message)) messages.push_back(message);
  void* const instance = host().api().instanceData;
  void* const plugin = host().api().pluginData;
  for (const int32_t message : messages) ASSERT_EQ(host().send(message), 2) << message;
  EXPECT_TRUE(host().callLog().empty()) << host().callLog().front();
  EXPECT_EQ(host().api().instanceData, instance);
  EXPECT_EQ(host().api().pluginData, plugin);
}

}  // namespace
