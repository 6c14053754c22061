// Path-aware typed reads of JSON values and the errors they raise.
#include "scene/json_fields.h"

#include <cctype>
#include <cmath>
#include <sstream>

namespace veltrane_cli {
namespace {

std::string shown(const nlohmann::ordered_json& value) {
  std::string text = value.dump();
  return text.size() > 60 ? text.substr(0, 57) + "..." : text;
}

}  // namespace

std::string fieldName(const std::string& key) {
  bool plain = !key.empty() && key.size() <= 60;
  for (char c : key) plain = plain && std::isprint(static_cast<unsigned char>(c));
  if (plain) return key;
  std::string quoted = nlohmann::ordered_json(key).dump(
      -1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
  return quoted.size() > 60 ? quoted.substr(0, 56) + "...\"" : quoted;
}

std::string numberText(double value) {
  std::ostringstream text;
  text.precision(15);
  text << value;
  return text.str();
}

JsonField::JsonField(const nlohmann::ordered_json& document, const std::string& file)
    : value_(&document), path_(""), file_(&file) {}

JsonField JsonField::member(const std::string& name) const {
  const nlohmann::ordered_json* child = nullptr;
  if (value_ && value_->is_object()) {
    auto found = value_->find(name);
    if (found != value_->end()) child = &*found;
  }
  std::string shownName = fieldName(name);
  return JsonField(child, path_.empty() ? shownName : path_ + "." + shownName, file_);
}

JsonField JsonField::element(std::size_t index) const {
  const nlohmann::ordered_json* child = nullptr;
  if (value_ && value_->is_array() && index < value_->size()) child = &(*value_)[index];
  return JsonField(child, path_ + "[" + std::to_string(index) + "]", file_);
}

void JsonField::fail(const std::string& expected) const {
  std::string where = path_.empty() ? "(top level)" : path_;
  std::string got = value_ ? ", got " + shown(*value_) : " (missing)";
  throw FieldError(*file_ + ": " + where + ": expected " + expected + got);
}

void JsonField::requireObject(std::initializer_list<const char*> allowedMembers) const {
  if (!present() || !value_->is_object()) fail("an object");
  for (auto it = value_->begin(); it != value_->end(); ++it) {
    bool known = false;
    std::string list;
    for (const char* name : allowedMembers) {
      known = known || it.key() == name;
      list += std::string(list.empty() ? "" : ", ") + name;
    }
    if (!known) {
      std::string name = fieldName(it.key());
      JsonField unknown(&it.value(), path_.empty() ? name : path_ + "." + name, file_);
      unknown.fail("no such field (known fields: " + list + ")");
    }
  }
}

std::size_t JsonField::arraySize(std::size_t minimum, std::size_t maximum,
                                 const std::string& what) const {
  if (!present() || !value_->is_array() || value_->size() < minimum || value_->size() > maximum)
    fail(what);
  return value_->size();
}

double JsonField::number(const std::string& what) const {
  if (!isNumber()) fail(what);
  return value_->get<double>();
}

double JsonField::numberIn(double minimum, double maximum) const {
  std::string what = "a number from " + numberText(minimum) + " to " + numberText(maximum);
  double value = number(what);
  if (!(value >= minimum && value <= maximum)) fail(what);
  return value;
}

bool JsonField::isWholeNumber() const {
  if (!present() || !value_->is_number()) return false;
  if (value_->is_number_integer()) return true;
  double value = value_->get<double>();
  return std::isfinite(value) && std::trunc(value) == value;
}

int32_t JsonField::integerIn(int64_t minimum, int64_t maximum) const {
  std::string what =
      "a whole number from " + std::to_string(minimum) + " to " + std::to_string(maximum);
  if (!isWholeNumber()) fail(what);
  if (value_->is_number_float()) {
    // Compared as a double first: a whole number written with a fraction can exceed int64.
    double value = value_->get<double>();
    if (value < static_cast<double>(minimum) || value > static_cast<double>(maximum)) fail(what);
    return static_cast<int32_t>(value);
  }
  int64_t value = value_->is_number_unsigned()
                      ? static_cast<int64_t>(std::min<uint64_t>(value_->get<uint64_t>(), INT64_MAX))
                      : value_->get<int64_t>();
  if (value < minimum || value > maximum) fail(what);
  return static_cast<int32_t>(value);
}

bool JsonField::boolean() const {
  if (!present() || !value_->is_boolean()) fail("true or false");
  return value_->get<bool>();
}

std::string JsonField::string(const std::string& what) const {
  if (!isString()) fail(what);
  return value_->get<std::string>();
}

std::string JsonField::fileName(const std::string& what) const {
  std::string name = string(what);
  if (name.empty()) fail(what);
  if (name.find('\0') != std::string::npos) fail(what + " without NUL characters");
  return name;
}

}  // namespace veltrane_cli
