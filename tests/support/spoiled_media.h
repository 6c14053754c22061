// Media files spoiled as real ones are: a video packet cut in half or overwritten in the
// middle, and photos carrying an EXIF orientation tag (written here byte by byte, so that no
// tool's idea of the tag stands between the test and the file).
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
