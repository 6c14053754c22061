// The protocol's name tables: every message and result has a readable name of its own, the
// tables name nothing else, and numbers outside them still print readably.
#include "host/wisp_protocol.h"

#include <gtest/gtest.h>

#include <climits>
#include <set>
#include <string>

namespace {

// The numbers a name table names, over a range holding every protocol number, each name
// non-empty and given once; the extremes of the type have none.
template <typename NameOf>
std::set<int32_t> namedNumbers(NameOf nameOf) {
  std::set<int32_t> numbers;
  std::set<std::string> names;
  for (int32_t number = -100; number <= 70000; ++number) {
    const char* name = nameOf(number);
    if (!name) continue;
    numbers.insert(number);
    EXPECT_NE(*name, '\0') << number;
    EXPECT_TRUE(names.insert(name).second) << "named twice: " << name;
  }
  for (const int32_t number : {INT_MIN, INT_MAX}) EXPECT_EQ(nameOf(number), nullptr);
  return numbers;
}

TEST(WispProtocol, MessagesAndResultsHaveNamesOfTheirOwn) {
  // The dispatch answers exactly the named messages (see the boundary tests).
  const std::set<int32_t> messages = namedNumbers(wispMessageName);
  for (const int32_t message : messages)
    EXPECT_EQ(wispMessageText(message), wispMessageName(message));
  for (const int32_t unknown : {5, 1000, 1015, -1, INT_MIN})
    EXPECT_EQ(wispMessageText(unknown), "unknown message " + std::to_string(unknown));
  EXPECT_EQ(namedNumbers(wispResultName),
            (std::set<int32_t>{kResultNotDone, kResultDone, kResultNotHandled, kResultException}));
}

}  // namespace
