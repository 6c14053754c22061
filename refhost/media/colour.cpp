// Names of the colour description's numbers.
#include "refhost/media/colour.h"

#include <utility>

namespace refhost {
namespace {

struct Named {
  int32_t number;
  const char* name;
};

constexpr Named kMatrices[] = {{1, "bt709"},    {5, "bt470bg"},  {6, "smpte170m"},
                               {9, "bt2020nc"}, {10, "bt2020c"}, {0, "gbr"}};
constexpr Named kPrimaries[] = {{1, "bt709"},  {5, "bt470bg"}, {6, "smpte170m"},
                                {9, "bt2020"}, {4, "bt470m"},  {7, "smpte240m"}};
constexpr Named kTransfers[] = {{1, "bt709"},         {6, "smpte170m"},  {13, "iec61966-2-1"},
                                {14, "bt2020-10"},    {15, "bt2020-12"}, {16, "smpte2084"},
                                {18, "arib-std-b67"}, {8, "linear"},     {4, "gamma22"},
                                {5, "gamma28"}};

template <std::size_t N>
std::string nameOf(const Named (&table)[N], int32_t number) {
  for (const Named& entry : table)
    if (entry.number == number) return entry.name;
  return std::to_string(number);
}

template <std::size_t N>
std::optional<int32_t> numberOf(const Named (&table)[N], const std::string& name) {
  for (const Named& entry : table)
    if (name == entry.name) return entry.number;
  return std::nullopt;
}

}  // namespace

std::string matrixName(int32_t matrix) { return nameOf(kMatrices, matrix); }
std::string primariesName(int32_t primaries) { return nameOf(kPrimaries, primaries); }
std::string transferName(int32_t transfer) { return nameOf(kTransfers, transfer); }

std::optional<int32_t> matrixFromName(const std::string& name) {
  if (name == "bt601") return ColourDescription::kMatrixSmpte170m;
  if (name == "bt2020") return ColourDescription::kMatrixBt2020;
  return numberOf(kMatrices, name);
}
std::optional<int32_t> primariesFromName(const std::string& name) {
  if (name == "bt601") return ColourDescription::kPrimariesSmpte170m;
  return numberOf(kPrimaries, name);
}
std::optional<int32_t> transferFromName(const std::string& name) {
  if (name == "bt601") return ColourDescription::kTransferSmpte170m;
  if (name == "srgb") return ColourDescription::kTransferSrgb;
  return numberOf(kTransfers, name);
}
std::optional<bool> fullRangeFromName(const std::string& name) {
  if (name == "tv" || name == "limited") return false;
  if (name == "pc" || name == "full") return true;
  return std::nullopt;
}

}  // namespace refhost
