// The Windows host has no FFmpeg (see video_reader_windows.cpp): there is no log to keep, and
// no error code to name.
#include "refhost/media/ffmpeg_utilities.h"

namespace refhost {

std::string avErrorText(int code) { return "error " + std::to_string(code); }
void keepLibraryErrorsForMessages() {}
std::string lastLibraryError() { return ""; }
void clearLibraryError() {}

}  // namespace refhost
