// Media spoiled as real files are: a video packet cut in half or overwritten, and photos with an
// EXIF orientation tag written byte by byte, so that no tool's idea of the tag stands between.
#pragma once

#include <string>

namespace testsupport {

// Spoils video packet `packet` (counted in file order) of the file in place: its second half
// zeroed, as a copy cut short loses it, or 64 bytes of its middle overwritten with noise.
enum class Spoiling { CutInHalf, Overwritten };
void spoilPacket(const std::string& path, int packet, Spoiling how);

// Puts an EXIF block holding the orientation tag (1 to 8) after a JPEG's start marker.
void tagExifOrientation(const std::string& jpeg, int orientation);

}  // namespace testsupport
