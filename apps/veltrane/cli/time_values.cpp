// Reading times in seconds and clock form.
#include "cli/time_values.h"

#include <cctype>
#include <cmath>
#include <vector>

#include "cli/cli_support.h"

namespace veltrane_cli {
namespace {

// A plain decimal number, digits with at most one point ("2", "2.5", ".5"); -1 otherwise.
double decimal(const std::string& text) {
  bool digit = false, point = false;
  for (char c : text) {
    if (std::isdigit(static_cast<unsigned char>(c))) {
      digit = true;
    } else if (c == '.' && !point) {
      point = true;
    } else {
      return -1;
    }
  }
  return digit ? std::stod(text) : -1;
}

}  // namespace

bool looksLikeTime(const std::string& text) {
  return text.find_first_of(".:smu") != std::string::npos;
}

double parseSeconds(const std::string& option, const std::string& text) {
  const UsageError refused("option '" + option +
                           "' expects a time: seconds (2.5, 90, 500ms) or [HH:]MM:SS[.mmm] "
                           "(00:01:02.500), got '" +
                           text + "'");
  std::string body = text;
  double unit = 1;
  bool suffixed = false;
  for (const auto& [suffix, seconds] :
       std::vector<std::pair<std::string, double>>{{"ms", 1e-3}, {"us", 1e-6}, {"s", 1}}) {
    if (body.size() > suffix.size() &&
        body.compare(body.size() - suffix.size(), suffix.size(), suffix) == 0) {
      body.erase(body.size() - suffix.size());
      unit = seconds;
      suffixed = true;
      break;
    }
  }
  std::vector<std::string> fields{""};
  for (char c : body) c == ':' ? fields.push_back("") : (void)(fields.back() += c);
  if (fields.size() > 3 || (fields.size() > 1 && suffixed)) throw refused;
  double seconds = 0;
  for (std::size_t i = 0; i < fields.size(); ++i) {
    const bool last = i + 1 == fields.size();
    const double value = decimal(fields[i]);
    // The clock's hours and minutes are whole; its minutes and seconds stay below 60.
    if (value < 0 || (!last && fields[i].find('.') != std::string::npos) || (i > 0 && value >= 60))
      throw refused;
    seconds = seconds * 60 + value;
  }
  if (!std::isfinite(seconds)) throw refused;
  return seconds * unit;
}

}  // namespace veltrane_cli
