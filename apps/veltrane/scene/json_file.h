// Reading the command line's JSON input files with limits: what a hostile or broken file can
// cost is bounded, and every refusal is one message naming the file and, where there is one,
// the field.
#pragma once

#include <cstddef>
#include <nlohmann/json.hpp>
#include <string>

namespace veltrane_cli {

// Deeper documents are refused; the command line's own formats need six levels.
constexpr std::size_t kMaxJsonDepth = 64;
// Larger files are refused before parsing, which bounds the memory a document can take.
constexpr std::size_t kMaxJsonBytes = std::size_t{16} << 20;

// Reads and parses a JSON file. Throws FieldError naming the file for one that cannot be read
// (missing, a directory, a symlink loop, too large) and for text that is not valid JSON, is
// nested deeper than kMaxJsonDepth, repeats a key within one object or holds a number beyond
// the range of a double; the last three also name the field.
nlohmann::ordered_json readJsonFile(const std::string& path);

}  // namespace veltrane_cli
