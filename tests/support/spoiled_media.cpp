// Spoiling packets found with ffprobe, and writing an EXIF block by hand.
#include "support/spoiled_media.h"

#include <cstdint>
#include <sstream>
#include <stdexcept>

#include "support/files.h"

namespace testsupport {

void spoilPacket(const std::string& path, int packet, Spoiling how) {
  std::istringstream lines(commandOutput(
      "ffprobe -v error -select_streams v -show_entries packet=pos,size -of csv=p=0 '" + path +
      "'"));
  std::string line;
  for (int i = 0; i <= packet; ++i)
    if (!std::getline(lines, line)) throw std::runtime_error(path + ": too few packets");
  // ffprobe lists size first, then position.
  const std::size_t size = std::stoul(line), at = std::stoul(line.substr(line.find(',') + 1));
  std::string bytes = slurp(path);
  if (how == Spoiling::CutInHalf) {
    for (std::size_t i = at + size / 2; i < at + size; ++i) bytes[i] = '\0';
  } else {
    uint32_t noise = 1;  // a linear congruential sequence: bytes no encoder would write
    for (std::size_t i = 0; i < 64 && size / 3 + i < size; ++i) {
      noise = (noise * 1103515245u + 12345u) & 0x7FFFFFFFu;
      bytes[at + size / 3 + i] = static_cast<char>(noise >> 16);
    }
  }
  writeText(path, bytes);
}

void tagExifOrientation(const std::string& jpeg, int orientation) {
  // "Exif\0\0", a big-endian TIFF header, and one IFD entry: tag 0x0112, type SHORT, count 1.
  const unsigned char block[] = {
      0xFF, 0xE1, 0, 34, 'E', 'x', 'i', 'f', 0, 0,
      'M',  'M',  0, 42, 0,   0,   0,   8,   0, 1,
      0x01, 0x12, 0, 3,  0,   0,   0,   1,   0, static_cast<unsigned char>(orientation),
      0,    0,    0, 0,  0,   0};
  const std::string bytes = slurp(jpeg);
  writeText(jpeg, bytes.substr(0, 2) + std::string(block, block + sizeof block) + bytes.substr(2));
}

}  // namespace testsupport
