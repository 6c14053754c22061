// Writing the call log.
#include "output/call_log.h"

#include <stdexcept>

namespace veltrane_cli {

CallLogFile::CallLogFile(const std::string& path)
    : path_(path), out_(std::make_shared<std::ofstream>(path, std::ios::trunc)) {
  if (!*out_) throw std::runtime_error(path + ": cannot create the call log");
}

std::function<void(int32_t, int32_t, const std::vector<std::string>&)> CallLogFile::recorder() {
  return [out = out_, path = path_](int32_t message, int32_t result,
                                    const std::vector<std::string>& calls) {
    *out << "== message " << message << " -> " << result << "\n";
    for (const std::string& call : calls) *out << call << "\n";
    out->flush();
    if (!*out) throw std::runtime_error(path + ": cannot write the call log");
  };
}

}  // namespace veltrane_cli
