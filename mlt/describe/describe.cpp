// Writes what MLT and the editors read to list the effect, from the panel the module itself
// declares, so that the descriptions cannot drift from the parameters:
//   describe MODULE.so FOLDER
// FOLDER receives transition_veltrane.yml and filter_veltrane.yml (MLT's metadata), veltrane.xml
// (Kdenlive's composition), meta.qml and ui.qml (Shotcut's filter and its panel).
#include <cstdio>
#include <fstream>
#include <string>

#include "descriptions.h"
#include "refhost/engine.h"

namespace {

void write(const std::string& path, const std::string& text) {
  std::ofstream file(path, std::ios::binary);
  file << text;
  if (!file.flush()) throw std::runtime_error("cannot write " + path);
}

}  // namespace

int main(int argc, char** argv) {
  using namespace veltrane_describe;
  if (argc != 3) {
    std::fprintf(stderr, "usage: describe MODULE.so FOLDER\n");
    return 2;
  }
  try {
    refhost::EngineOptions options;
    options.modulePath = argv[1];
    // No context: declaring the panel draws nothing.
    refhost::Engine engine(std::move(options));
    engine.start();
    const std::vector<Setting> composition = settingsOf(engine.panel(), true);
    const std::vector<Setting> filter = settingsOf(engine.panel(), false);
    const std::string folder = argv[2];
    write(folder + "/transition_veltrane.yml", mltMetadata(composition, true));
    write(folder + "/filter_veltrane.yml", mltMetadata(filter, false));
    write(folder + "/veltrane.xml", kdenliveComposition(composition));
    write(folder + "/meta.qml", shotcutMetadata(filter));
    write(folder + "/ui.qml", shotcutPanel(filter));
    engine.finish();
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "describe: %s\n", error.what());
    return 1;
  }
}
