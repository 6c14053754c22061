// FFmpeg's error texts and the log callback that keeps its error messages.
#include "refhost/media/ffmpeg_utilities.h"

extern "C" {
#include <libavutil/error.h>
#include <libavutil/log.h>
}

#include <cstdarg>

namespace refhost {
namespace {

// The libraries report details ("Invalid NAL unit size") only through their log, which would
// otherwise print several lines around the one line of a failure.
thread_local std::string lastError;

void keepLibraryError(void* context, int level, const char* format, va_list arguments) {
  if (level > AV_LOG_ERROR) return;
  char line[512] = {};
  int prefix = 0;
  av_log_format_line2(context, level, format, arguments, line, sizeof line, &prefix);
  std::string text(line);
  while (!text.empty() && (text.back() == '\n' || text.back() == '.')) text.pop_back();
  // The prefix names the library object by address ("[h264 @ 0x...]"): noise to a user.
  std::string::size_type object = text.find("] ");
  if (text.rfind('[', 0) == 0 && object != std::string::npos) text.erase(0, object + 2);
  if (!text.empty()) lastError = text;
}

}  // namespace

std::string avErrorText(int code) {
  char buffer[AV_ERROR_MAX_STRING_SIZE] = {};
  av_strerror(code, buffer, sizeof buffer);
  return buffer;
}

void keepLibraryErrorsForMessages() { av_log_set_callback(keepLibraryError); }

std::string lastLibraryError() { return lastError; }

void clearLibraryError() { lastError.clear(); }

}  // namespace refhost
