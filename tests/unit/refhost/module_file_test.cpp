// Damaged module files: truncated or altered copies of the built module are refused with one
// message naming the path and the fault, before the system loader could fault on them.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

#include "refhost/module.h"
#include "support/temp_paths.h"

TEST(ModuleFile, DamagedCopiesAreRefusedWithTheFault) {
  std::ifstream in(VELTRANE_MODULE_PATH, std::ios::binary);
  const std::string module(std::istreambuf_iterator<char>(in), {});
  auto patched = [&](std::size_t offset, char value) {
    return module.substr(0, offset) + value + module.substr(offset + 1);
  };
  // The ELF header holds the class at byte 4, the byte order at 5, the type at 16 and the
  // machine at 18; the segments of the built module end some 230 KiB in.
  const std::pair<std::string, const char*> cases[] = {
      {"", "too short for an ELF header"},
      {module.substr(0, 1024), "segment 0 ends at byte"},
      {module.substr(0, 200 * 1024), "is truncated or corrupt"},
      {"#!/bin/sh\n" + module.substr(10), "ELF signature"},
      {patched(4, 1), "32-bit ELF file"},
      {patched(5, 2), "byte order"},
      {patched(16, 2), "not a shared object"},
      {patched(18, 40), "built for ELF machine 40"},
  };
  const std::string path = testsupport::makeTempFile("veltrane_module_file_");
  for (const auto& [bytes, fault] : cases) {
    std::ofstream(path, std::ios::binary | std::ios::trunc) << bytes;
    std::string message;
    try {
      refhost::Module loaded(path);
    } catch (const std::runtime_error& error) {
      message = error.what();
    }
    EXPECT_NE(message.find("'" + path + "': not a loadable shared library (it"), std::string::npos)
        << message;
    EXPECT_NE(message.find(fault), std::string::npos) << message;
  }
  std::remove(path.c_str());
}
