// FFmpeg's text for one of its error codes, for messages that name what went wrong.
#pragma once

extern "C" {
#include <libavutil/error.h>
}

#include <string>

namespace refhost {

inline std::string avErrorText(int code) {
  char buffer[AV_ERROR_MAX_STRING_SIZE] = {};
  av_strerror(code, buffer, sizeof buffer);
  return buffer;
}

}  // namespace refhost
