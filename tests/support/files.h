// Whole files read and written in one call, and what a shell command prints.
#pragma once

#include <string>

namespace testsupport {

// The file's bytes; "" when it cannot be read.
std::string slurp(const std::string& path);
void writeText(const std::string& path, const std::string& bytes);
// What a shell command (ffmpeg, ffprobe, nm) prints on stdout.
std::string commandOutput(const std::string& command);

}  // namespace testsupport
