// Loading plug-in modules: one clear error naming the path and the fault, for paths that are no
// file and for damaged copies of the built module, before the system loader could fault.
#include "refhost/core/module.h"

#include <gtest/gtest.h>

#include <optional>

#include "support/files.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

TEST(ModuleLoading, ErrorsNameThePathAndTheFault) {
  const std::string module = testsupport::slurp(VELTRANE_MODULE_PATH);
  auto patched = [&](std::size_t offset, char value) {
    return module.substr(0, offset) + value + module.substr(offset + 1);
  };
  testsupport::ScratchDirectory folder;
  const std::string copy = folder.file("copy.so");
  struct Case {
    std::string path;
    std::optional<std::string> bytes;  // written to the path first
    std::string fault;
  };
  // The ELF header holds the class at byte 4, the byte order at 5, the type at 16 and the
  // machine at 18; the segments of the built module end some 230 KiB in.
  const Case cases[] = {
      {"", {}, "the path is empty"},
      {VELTRANE_SOURCE_DIR, {}, "it is a directory"},
      {copy, "", "library (it is too short for an ELF header"},
      {copy, module.substr(0, 1024), "library (it is truncated or corrupt: segment "},
      {copy, module.substr(0, 200 * 1024), "library (it is truncated or corrupt"},
      {copy, "#!/bin/sh\n" + module.substr(10),
       "library (it does not start with the ELF signature"},
      {copy, patched(4, 1), "library (it is a 32-bit ELF file"},
      {copy, patched(5, 2), "library (its byte order"},
      {copy, patched(16, 2), "library (it is an ELF file of type 2, not a shared object"},
      {copy, patched(18, 40), "library (it is built for ELF machine 40"}};
  for (const Case& c : cases) {
    if (c.bytes) testsupport::writeText(c.path, *c.bytes);
    std::string message;
    try {
      Module loaded(c.path);
    } catch (const std::runtime_error& error) {
      message = error.what();
    }
    EXPECT_NE(message.find("'" + c.path + "': "), std::string::npos) << message;
    EXPECT_NE(message.find(c.fault), std::string::npos) << message;
  }
}

}  // namespace
}  // namespace refhost
