// Bounded reading and checked parsing of JSON input files.
#include "scene/json_file.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <vector>

#include "scene/json_fields.h"

namespace veltrane_cli {
namespace {

using Json = nlohmann::ordered_json;

// Builds the document from the parser's events, as the library's own builder does, and refuses
// what that builder would take: nesting deeper than kMaxJsonDepth (the library prints, copies
// and compares documents by recursion) and a key repeated within one object (which it would
// silently overwrite). It knows at every event which field the parser is in, so a refusal, and
// a number beyond a double's range, names the field.
class CheckedBuilder {
 public:
  explicit CheckedBuilder(const std::string& file) : file_(file) {}

  Json take() { return std::move(root_); }

  bool null() { return place(nullptr); }
  bool boolean(bool value) { return place(value); }
  bool number_integer(Json::number_integer_t value) { return place(value); }
  bool number_unsigned(Json::number_unsigned_t value) { return place(value); }
  bool number_float(Json::number_float_t value, const Json::string_t&) { return place(value); }
  bool string(Json::string_t& value) { return place(std::move(value)); }
  bool binary(Json::binary_t& value) { return place(Json::binary(std::move(value))); }
  bool start_object(std::size_t) { return open(Json::object()); }
  bool start_array(std::size_t) { return open(Json::array()); }
  bool end_object() { return close(); }
  bool end_array() { return close(); }

  bool key(Json::string_t& name) {
    Level& object = open_.back();
    bool repeated = object.value->contains(name);
    object.key = std::move(name);
    if (repeated) fail(path(false), "each key once in an object (this one is repeated)");
    return true;
  }

  template <typename Exception>
  bool parse_error(std::size_t, const std::string&, const Exception& error) {
    // The parser's only range error: a number beyond what a double holds.
    if (error.id == 406)
      fail(path(true), "a number within the range of a double (magnitude below 1.8e308), got " +
                           overflowingNumber(error.what()));
    throw FieldError(file_ + ": not valid JSON: " + withoutIdentifier(error.what()));
  }

 private:
  struct Level {
    Json* value = nullptr;     // the open array or object
    std::size_t elements = 0;  // arrays: elements begun so far
    std::string key;           // objects: the last key read
  };

  // Stores a value where the parser is; pointers to open containers stay valid, since a
  // container only grows while none of its elements is open.
  Json* place(Json value) {
    if (open_.empty()) {
      root_ = std::move(value);
      return &root_;
    }
    Level& parent = open_.back();
    if (parent.value->is_array()) {
      ++parent.elements;
      parent.value->push_back(std::move(value));
      return &parent.value->back();
    }
    Json& slot = (*parent.value)[parent.key];
    slot = std::move(value);
    return &slot;
  }

  bool open(Json container) {
    if (open_.size() >= kMaxJsonDepth) {
      if (open_.back().value->is_array()) ++open_.back().elements;
      fail(path(false),
           "at most " + std::to_string(kMaxJsonDepth) + " levels of nested arrays and objects");
    }
    Json* value = place(std::move(container));
    open_.push_back(Level{value, 0, {}});
    return true;
  }

  bool close() {
    open_.pop_back();
    return true;
  }

  // The field the parser is in. `pending`: it is reading a value not yet placed, which in an
  // array is the element after the last one placed.
  std::string path(bool pending) const {
    std::string text;
    for (std::size_t i = 0; i < open_.size(); ++i) {
      const Level& level = open_[i];
      if (level.value->is_array()) {
        bool next = pending && i + 1 == open_.size();
        text += "[" + std::to_string(next ? level.elements : level.elements - 1) + "]";
      } else {
        text += (text.empty() ? "" : ".") + fieldName(level.key);
      }
    }
    return text;
  }

  [[noreturn]] void fail(const std::string& where, const std::string& expected) const {
    throw FieldError(file_ + ": " + (where.empty() ? "(top level)" : where) + ": expected " +
                     expected);
  }

  // The library's messages start with an identifier in brackets that means nothing to a user.
  static std::string withoutIdentifier(const std::string& message) {
    std::string::size_type end = message.find("] ");
    return message.rfind("[json.exception.", 0) == 0 && end != std::string::npos
               ? message.substr(end + 2)
               : message;
  }

  // The number's text as the library quotes it in its overflow message.
  static std::string overflowingNumber(const std::string& message) {
    std::string::size_type first = message.find('\'');
    std::string::size_type last = message.rfind('\'');
    if (first == std::string::npos || last <= first) return "";
    std::string number = message.substr(first + 1, last - first - 1);
    return number.size() > 40 ? number.substr(0, 37) + "..." : number;
  }

  const std::string& file_;
  Json root_;
  std::vector<Level> open_;
};

std::string readLimited(const std::string& path) {
  std::error_code error;
  const std::filesystem::file_status status = std::filesystem::status(path, error);
  if (error) throw FieldError(path + ": cannot be read (" + error.message() + ")");
  if (std::filesystem::is_directory(status))
    throw FieldError(path + ": is a directory; expected a JSON file");
  std::ifstream in(path, std::ios::binary);
  if (!in) throw FieldError(path + ": cannot be read (" + std::strerror(errno) + ")");
  std::string text;
  char buffer[1 << 16];
  while (in.read(buffer, sizeof buffer) || in.gcount() > 0) {
    const auto got = static_cast<std::size_t>(in.gcount());
    if (text.size() + got > kMaxJsonBytes)
      throw FieldError(path + ": is larger than " + std::to_string(kMaxJsonBytes >> 20) +
                       " MiB; expected a smaller JSON file");
    text.append(buffer, got);
  }
  if (in.bad()) throw FieldError(path + ": cannot be read (a read failed)");
  return text;
}

}  // namespace

nlohmann::ordered_json readJsonFile(const std::string& path) {
  std::string text = readLimited(path);
  CheckedBuilder builder(path);
  Json::sax_parse(text, &builder);
  return builder.take();
}

}  // namespace veltrane_cli
