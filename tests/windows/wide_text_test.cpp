// Wide texts on Windows are UTF-16: the registration texts as the host's buffers receive them.
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "refhost/core/module.h"

namespace {

static_assert(sizeof(wchar_t) == 2, "Windows hosts read wide texts as UTF-16");

TEST(WideText, RegistrationTextsAreUtf16CodeUnits) {
  refhost::Module module(VELTRANE_MODULE_PATH);
  // A marker in every unit, so a unit the bounded copy did not zero-fill shows.
  std::vector<char16_t> name(kRegistrationNameChars, 0xFFFF), other(kRegistrationNoticeChars);
  PluginRegistration record{};
  record.name = reinterpret_cast<wchar_t*>(name.data());
  record.category = record.vendor = record.notice = reinterpret_cast<wchar_t*>(other.data());
  module.fillRegistration(&record);
  const std::u16string expected = u"Veltrane {split-screen}";
  EXPECT_EQ(std::u16string(name.data(), expected.size()), expected);
  EXPECT_TRUE(
      std::all_of(name.begin() + expected.size(), name.end(), [](char16_t u) { return !u; }));
}

}  // namespace
