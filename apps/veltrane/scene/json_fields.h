// Typed reading of a JSON document that knows where it is: every value carries its file and
// its path ("layers[1].source.pattern"), so a wrong value becomes one message naming the file,
// the field and what was expected.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>

namespace veltrane_cli {

// "FILE: FIELD: expected WHAT, got VALUE" (", got" left out for a missing field).
class FieldError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

class JsonField {
 public:
  // The document's top level.
  JsonField(const nlohmann::ordered_json& document, const std::string& file);

  bool present() const { return value_ != nullptr; }
  const nlohmann::ordered_json& json() const { return *value_; }
  const std::string& path() const { return path_; }
  const std::string& file() const { return *file_; }

  // A member of an object (absent when the object lacks it); an element of an array.
  JsonField member(const std::string& name) const;
  JsonField element(std::size_t index) const;

  [[noreturn]] void fail(const std::string& expected) const;

  // Each throws FieldError saying what was expected when the value is absent or not that.
  void requireObject(std::initializer_list<const char*> allowedMembers) const;
  std::size_t arraySize(std::size_t minimum, std::size_t maximum, const std::string& what) const;
  bool isNumber() const { return present() && value_->is_number(); }
  // An integer, or a number written with a fraction of zero ("64.0", "1e3").
  bool isWholeNumber() const;
  bool isString() const { return present() && value_->is_string(); }
  double number(const std::string& what) const;
  double numberIn(double minimum, double maximum) const;
  int32_t integerIn(int64_t minimum, int64_t maximum) const;
  bool boolean() const;
  std::string string(const std::string& what) const;
  // A non-empty string without NUL characters, which a file name cannot hold.
  std::string fileName(const std::string& what) const;

 private:
  JsonField(const nlohmann::ordered_json* value, std::string path, const std::string* file)
      : value_(value), path_(std::move(path)), file_(file) {}

  const nlohmann::ordered_json* value_;
  std::string path_;
  const std::string* file_;
};

// An object key as a message shows it: as written when it is short and printable, else quoted
// with escapes and shortened, so that a message stays one line.
std::string fieldName(const std::string& key);

// A number without trailing noise: the shortest text that reads back as the same float.
std::string numberText(double value);

}  // namespace veltrane_cli
