// Damaged module files: truncated or altered copies of the built module are refused with one
// message naming the path and the fault, before the system loader could fault on them.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>

#include "refhost/module.h"
#include "support/temp_paths.h"

namespace refhost {
namespace {

std::string readAll(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), {});
}

TEST(ModuleFile, DamagedCopiesAreRefusedWithTheFault) {
  const std::string module = readAll(VELTRANE_MODULE_PATH);
  ASSERT_GT(module.size(), 300000u);
  auto patched = [&](std::size_t offset, char value) {
    std::string copy = module;
    copy[offset] = value;
    return copy;
  };
  struct Case {
    const char* name;
    std::string bytes;
    const char* fault;
  };
  // ELF64 header: byte 4 class, 5 byte order, 16 type, 18 machine.
  const Case cases[] = {
      {"empty", "", "too short for an ELF header"},
      {"63 bytes", module.substr(0, 63), "too short for an ELF header"},
      {"header only", module.substr(0, 64), "program headers"},
      {"1 KiB", module.substr(0, 1024), "segment 0 ends at byte"},
      {"16 KiB", module.substr(0, 16384), "is truncated or corrupt"},
      {"200 KiB", module.substr(0, 200 * 1024), "is truncated or corrupt"},
      {"not ELF", "#!/bin/sh\n" + module.substr(10), "ELF signature"},
      {"32-bit", patched(4, 1), "32-bit ELF file"},
      {"big-endian", patched(5, 2), "byte order"},
      {"executable", patched(16, 2), "not a shared object"},
      {"other machine", patched(18, 40), "built for ELF machine 40"},
  };
  const std::string folder = testsupport::makeTempDirectory("veltrane_module_file_");
  for (const Case& c : cases) {
    const std::string path = folder + "/veltrane.so";
    std::ofstream(path, std::ios::binary | std::ios::trunc) << c.bytes;
    std::string message;
    try {
      Module loaded(path);
    } catch (const std::runtime_error& error) {
      message = error.what();
    }
    EXPECT_NE(message.find("'" + path + "'"), std::string::npos) << c.name << ": " << message;
    EXPECT_NE(message.find(c.fault), std::string::npos) << c.name << ": " << message;
  }
  std::filesystem::remove_all(folder);
}

}  // namespace
}  // namespace refhost
