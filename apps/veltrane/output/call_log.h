// `--call-log FILE`: every message the host sends and the host operations the plug-in called
// during it, written as they happen, for someone looking into what the plug-in does.
#pragma once

#include <cstdint>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "refhost/engine.h"

namespace veltrane_cli {

class CallLogFile {
 public:
  // Creates (or empties) the file. Throws std::runtime_error naming it when it cannot.
  explicit CallLogFile(const std::string& path);

  // The engine's message callback writing to this file: "== message 10 -> 1", then one line
  // per host operation. Throws std::runtime_error naming the file when a write fails.
  std::function<void(int32_t, int32_t, const std::vector<std::string>&)> recorder();

 private:
  std::string path_;
  std::shared_ptr<std::ofstream> out_;
};

}  // namespace veltrane_cli
