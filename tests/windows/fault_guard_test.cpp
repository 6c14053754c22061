// Message 1 under a host whose registry faults while it is destroyed: the plug-in answers 2,
// clears the slot, and the process goes on loading and unloading.
#include <gtest/gtest.h>

#include <array>
#include <cstdint>

#include "refhost/core/host.h"
#include "refhost/core/module.h"

namespace {

// Writes to an address no process maps; the volatile keeps the compiler from seeing which.
void faultingDestructor(void*) {
  volatile uintptr_t address = 0x10;
  *reinterpret_cast<volatile int*>(address) = 1;
}

TEST(FaultGuard, UnloadAnswersTwoWhenDestroyingTheRegistryFaults) {
  std::array<void (*)(void*), 16> faultingTable;
  faultingTable.fill(faultingDestructor);
  // Stand-in registries hold only the virtual table pointer the destructor is called through:
  // one whose entries fault, one that points at unmapped memory.
  const void* virtualTables[] = {faultingTable.data(), reinterpret_cast<void*>(uintptr_t{0x20})};
  refhost::Module module(VELTRANE_MODULE_PATH);
  refhost::Host host(module);
  for (const void* virtualTable : virtualTables) {
    const void* registry[] = {virtualTable};
    host.api().pluginData = registry;
    EXPECT_EQ(host.send(kMessageUnload), 2);
    EXPECT_EQ(host.api().pluginData, nullptr);
    EXPECT_EQ(host.send(kMessageLoad), 1);  // the guard is gone: a real registry loads and unloads
    EXPECT_EQ(host.send(kMessageUnload), 1);
  }
}

}  // namespace
