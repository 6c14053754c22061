// Reading an ELF file's header and program headers with plain reads (no mapping), so a broken
// file can only produce a message, never a fault.
#ifndef _WIN32
#include "refhost/platform/elf_check.h"

#include <elf.h>
#include <fcntl.h>
#include <link.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <vector>

// The linker places this symbol at the running program's own ELF header; its class, byte order
// and machine are what a module must match. Weak, so a toolchain without it only loses the
// machine comparison.
extern "C" const ElfW(Ehdr) __ehdr_start __attribute__((weak));

namespace refhost {
namespace {

constexpr unsigned char kOwnClass = sizeof(void*) == 8 ? ELFCLASS64 : ELFCLASS32;

class ModuleFile {
 public:
  explicit ModuleFile(const std::string& path) : fd_(open(path.c_str(), O_RDONLY | O_CLOEXEC)) {}
  ~ModuleFile() {
    if (fd_ >= 0) close(fd_);
  }
  ModuleFile(const ModuleFile&) = delete;
  ModuleFile& operator=(const ModuleFile&) = delete;

  int fd() const { return fd_; }
  // Reads exactly `size` bytes at `offset`; false when the file ends before.
  bool readAt(void* into, std::size_t size, uint64_t offset) const {
    auto* bytes = static_cast<char*>(into);
    while (size > 0) {
      ssize_t got = pread(fd_, bytes, size, static_cast<off_t>(offset));
      if (got < 0 && errno == EINTR) continue;
      if (got <= 0) return false;
      bytes += got;
      size -= static_cast<std::size_t>(got);
      offset += static_cast<uint64_t>(got);
    }
    return true;
  }

 private:
  int fd_;
};

std::string bytes(uint64_t count) { return std::to_string(count) + " bytes"; }

std::string headerProblem(const ElfW(Ehdr) & header) {
  if (header.e_ident[EI_CLASS] != kOwnClass)
    return std::string("it is a ") + (header.e_ident[EI_CLASS] == ELFCLASS32 ? "32" : "64") +
           "-bit ELF file; this host loads " + (kOwnClass == ELFCLASS64 ? "64" : "32") +
           "-bit modules";
  const ElfW(Ehdr)* own = &__ehdr_start;
  if (own && header.e_ident[EI_DATA] != own->e_ident[EI_DATA])
    return "its byte order is not this machine's";
  if (header.e_type != ET_DYN)
    return "it is an ELF file of type " + std::to_string(header.e_type) + ", not a shared object";
  if (own && header.e_machine != own->e_machine)
    return "it is built for ELF machine " + std::to_string(header.e_machine) +
           "; this host runs on machine " + std::to_string(own->e_machine);
  if (header.e_phentsize != sizeof(ElfW(Phdr)) || header.e_phnum == 0)
    return "its program header table is malformed";
  return "";
}

}  // namespace

std::string elfModuleProblem(const std::string& path) {
  ModuleFile file(path);
  struct stat info {};
  if (file.fd() < 0 || fstat(file.fd(), &info) != 0) return std::strerror(errno);
  auto size = static_cast<uint64_t>(info.st_size);
  ElfW(Ehdr) header{};
  if (!file.readAt(&header, sizeof header, 0))
    return "it is too short for an ELF header (" + bytes(size) + ")";
  if (std::memcmp(header.e_ident, ELFMAG, SELFMAG) != 0)
    return "it does not start with the ELF signature";
  if (std::string problem = headerProblem(header); !problem.empty()) return problem;

  std::vector<ElfW(Phdr)> segments(header.e_phnum);
  uint64_t tableSize = segments.size() * sizeof(ElfW(Phdr));
  if (header.e_phoff > size || size - header.e_phoff < tableSize ||
      !file.readAt(segments.data(), tableSize, header.e_phoff))
    return "it is truncated: its program headers (" + bytes(tableSize) + " at byte " +
           std::to_string(header.e_phoff) + ") lie beyond the end of a file of " + bytes(size);
  for (std::size_t i = 0; i < segments.size(); ++i) {
    const ElfW(Phdr)& segment = segments[i];
    uint64_t end = segment.p_offset + segment.p_filesz;
    if (segment.p_offset > size || end > size || end < segment.p_offset)
      return "it is truncated or corrupt: segment " + std::to_string(i) + " ends at byte " +
             std::to_string(end) + " of a file of " + bytes(size);
  }
  return "";
}

}  // namespace refhost
#endif
