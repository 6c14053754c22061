// Xvfb and screenshots for the window tests.
#include "x_session.h"

#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <memory>
#include <stdexcept>

#include "refhost/media/image_files.h"

XSession::XSession() {
  int pipe_[2];
  if (pipe(pipe_) != 0) throw std::runtime_error("cannot make a pipe for Xvfb");
  // Xvfb picks a free display and writes its number to the pipe once it takes connections.
  server_ = std::make_unique<ChildProcess>(
      std::vector<std::string>{"Xvfb", "-displayfd", std::to_string(pipe_[1]), "-screen", "0",
                               "1600x1000x24", "-nolisten", "tcp"});
  close(pipe_[1]);
  std::string number;
  char c = 0;
  while (read(pipe_[0], &c, 1) == 1 && c != '\n') number += c;
  close(pipe_[0]);
  if (number.empty())
    throw std::runtime_error("Xvfb did not start (is the xvfb package installed?)");
  setenv("DISPLAY", (":" + number).c_str(), 1);
}

void XSession::run(const std::vector<std::string>& argv) const {
  ChildProcess tool(argv);
  if (tool.wait(30) != 0) throw std::runtime_error(argv[0] + " failed");
}

refhost::RgbaImage XSession::screenshot(const std::string& scratchDirectory) const {
  std::string path = scratchDirectory + "/screen.png";
  run({"import", "-window", "root", path});
  return refhost::readImageFile(path);
}

bool findPicture(const refhost::RgbaImage& screen, const refhost::RgbaImage& picture, int margin,
                 int& x, int& y) {
  std::vector<std::pair<int, int>> samples;
  for (int j = 0; j < 5; ++j) {
    for (int i = 0; i < 7; ++i)
      samples.emplace_back(margin + i * (picture.width - 2 * margin) / 6,
                           margin + j * (picture.height - 2 * margin) / 4);
  }
  auto sameRgb = [](const uint8_t* a, const uint8_t* b) { return std::memcmp(a, b, 3) == 0; };
  for (y = 0; y + picture.height <= screen.height; ++y) {
    for (x = 0; x + picture.width <= screen.width; ++x) {
      int misses = 0;  // an overlay handle may cover a sample or two
      for (const auto& [sx, sy] : samples) {
        if (!sameRgb(screen.at(x + sx, y + sy), picture.at(sx, sy)) && ++misses > 2) break;
      }
      if (misses <= 2) return true;
    }
  }
  return false;
}
