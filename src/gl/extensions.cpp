// GL 3 and later list extensions one by one (the joined string is gone from core profiles);
// older contexts give one space-separated string.
#include "gl/extensions.h"

#include <GL/glew.h>

#include <cstdlib>
#include <cstring>

namespace veltrane {
namespace {

// The major number that leads a version string such as "4.5 (Core Profile) Mesa"; only it
// decides which list to read. False when the string does not start with a number.
bool parseMajorVersion(const char* version, long* major) {
  char* end = nullptr;
  *major = std::strtol(version, &end, 10);
  return end != version;
}

bool inIndexedList(const std::string& name, const ExtensionQueries& queries) {
  const int count = queries.count();
  for (int i = 0; i < count; ++i) {
    const char* extension = queries.indexed(i);
    if (extension != nullptr && name == extension) return true;
  }
  return false;
}

bool inSpaceSeparatedList(const std::string& name, const char* list) {
  if (list == nullptr) return false;
  const char* token = list;
  while (*token != '\0') {
    while (*token == ' ') ++token;
    const char* end = token;
    while (*end != '\0' && *end != ' ') ++end;
    const std::size_t length = static_cast<std::size_t>(end - token);
    if (length == name.size() && std::strncmp(token, name.c_str(), length) == 0) return true;
    token = end;
  }
  return false;
}

const char* glText(GLenum name) { return reinterpret_cast<const char*>(glGetString(name)); }

}  // namespace

bool isExtensionListed(const std::string& name, const ExtensionQueries& queries) {
  const char* version = queries.version();
  long major = 0;
  if (version != nullptr && parseMajorVersion(version, &major) && major >= 3) {
    return inIndexedList(name, queries);
  }
  return inSpaceSeparatedList(name, queries.spaceSeparated());
}

bool isExtensionSupported(const std::string& name) {
  ExtensionQueries queries;
  queries.version = [] { return glText(GL_VERSION); };
  queries.count = [] {
    GLint count = 0;
    glGetIntegerv(GL_NUM_EXTENSIONS, &count);
    return static_cast<int>(count);
  };
  queries.indexed = [](int i) {
    return reinterpret_cast<const char*>(glGetStringi(GL_EXTENSIONS, static_cast<GLuint>(i)));
  };
  queries.spaceSeparated = [] { return glText(GL_EXTENSIONS); };
  return isExtensionListed(name, queries);
}

}  // namespace veltrane
