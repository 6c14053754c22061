// Names of the colour description's numbers.
#include "refhost/media/colour.h"

#include <utility>

namespace refhost {
namespace {

struct Named {
  int32_t number;
  const char* name;
};

using C = ColourDescription;
constexpr Named kMatrices[] = {{C::kMatrixBt709, "bt709"},
                               {C::kMatrixBt470bg, "bt470bg"},
                               {C::kMatrixSmpte170m, "smpte170m"},
                               {C::kMatrixBt2020, "bt2020nc"},
                               {C::kMatrixBt2020Constant, "bt2020c"},
                               {C::kMatrixRgb, "gbr"}};
constexpr Named kPrimaries[] = {
    {C::kPrimariesBt709, "bt709"},         {C::kPrimariesBt470bg, "bt470bg"},
    {C::kPrimariesSmpte170m, "smpte170m"}, {C::kPrimariesBt2020, "bt2020"},
    {C::kPrimariesBt470m, "bt470m"},       {C::kPrimariesSmpte240m, "smpte240m"}};
constexpr Named kTransfers[] = {
    {C::kTransferBt709, "bt709"},         {C::kTransferSmpte170m, "smpte170m"},
    {C::kTransferSrgb, "iec61966-2-1"},   {C::kTransferBt2020_10, "bt2020-10"},
    {C::kTransferBt2020_12, "bt2020-12"}, {C::kTransferPq, "smpte2084"},
    {C::kTransferHlg, "arib-std-b67"},    {C::kTransferLinear, "linear"},
    {C::kTransferGamma22, "gamma22"},     {C::kTransferGamma28, "gamma28"}};

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
}  // namespace refhost
