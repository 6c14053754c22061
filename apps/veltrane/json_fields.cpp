// Path-aware typed reads of JSON values and the errors they raise.
#include "json_fields.h"

#include <cmath>
#include <fstream>
#include <sstream>

namespace veltrane_cli {
namespace {

std::string shown(const nlohmann::json& value) {
  std::string text = value.dump();
  return text.size() > 60 ? text.substr(0, 57) + "..." : text;
}

}  // namespace

std::string numberText(double value) {
  std::ostringstream text;
  text.precision(15);
  text << value;
  return text.str();
}

nlohmann::json readJsonFile(const std::string& path) {
  std::ifstream in(path);
  if (!in) throw FieldError(path + ": cannot be read");
  try {
    return nlohmann::json::parse(in);
  } catch (const nlohmann::json::parse_error& error) {
    throw FieldError(path + ": not valid JSON: " + error.what());
  }
}

JsonField::JsonField(const nlohmann::json& document, const std::string& file)
    : value_(&document), path_(""), file_(&file) {}

JsonField JsonField::member(const std::string& name) const {
  const nlohmann::json* child = nullptr;
  if (value_ && value_->is_object()) {
    auto found = value_->find(name);
    if (found != value_->end()) child = &*found;
  }
  return JsonField(child, path_.empty() ? name : path_ + "." + name, file_);
}

JsonField JsonField::element(std::size_t index) const {
  const nlohmann::json* child = nullptr;
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
      JsonField unknown(&it.value(), path_.empty() ? it.key() : path_ + "." + it.key(), file_);
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

int32_t JsonField::integerIn(int64_t minimum, int64_t maximum) const {
  std::string what =
      "a whole number from " + std::to_string(minimum) + " to " + std::to_string(maximum);
  if (!present() || !value_->is_number_integer()) fail(what);
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

}  // namespace veltrane_cli
