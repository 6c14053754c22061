// The descriptions written from the editors' settings: MLT's metadata (YAML), Kdenlive's
// composition (XML) and Shotcut's filter (meta.qml and its panel, ui.qml).
#pragma once

#include <string>
#include <vector>

#include "settings.h"

namespace veltrane_describe {

extern const char* const kTitle;
extern const char* const kDescription;

std::string mltMetadata(const std::vector<Setting>& settings, bool transition);
std::string kdenliveComposition(const std::vector<Setting>& settings);
std::string shotcutMetadata(const std::vector<Setting>& settings);
std::string shotcutPanel(const std::vector<Setting>& settings);

// Text safe inside XML attributes and elements, and inside a single-quoted JavaScript string.
std::string xmlEscaped(const std::string& text);
std::string scriptQuoted(const std::string& text);

}  // namespace veltrane_describe
