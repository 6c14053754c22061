// FFmpeg's error codes and log messages in the host's words: the text of a code, and the
// library's own error messages kept for the one line a failure gives instead of printed.
#pragma once

#include <string>

namespace refhost {

// FFmpeg's text for one of its error codes ("Invalid data found when processing input").
std::string avErrorText(int code);

// Sets FFmpeg's process-wide log callback to one that prints nothing and keeps, for each
// thread, the last error message logged, which lastLibraryError() gives to the messages of
// failures. For the application that owns the process's standard error to call once, before
// any media is opened; a library never calls it (an editor loading the MLT bridge owns FFmpeg's
// log), and where it was not called, failures simply carry no detail of the library's.
void keepLibraryErrorsForMessages();

// The last error message FFmpeg logged on this thread since clearLibraryError(), without the
// library object's address ("Invalid NAL unit size"); empty when none was, or when the
// application kept FFmpeg's own log.
std::string lastLibraryError();
void clearLibraryError();

}  // namespace refhost
