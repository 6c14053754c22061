// melt and `veltrane render` as the bridge's tests run them.
#include "melt_runs.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <climits>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "refhost/media/image_files.h"

extern char** environ;

namespace mlttest {
namespace {

std::string readText(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  std::stringstream text;
  text << file.rdbuf();
  return text.str();
}

void writeText(const std::string& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}

// The environment the bridge's tests give a program: the build tree's MLT folders, never the
// developer's own module, and `extra` variables over what is inherited.
std::vector<std::string> environmentWith(const std::vector<std::string>& extra) {
  std::vector<std::string> environment = {std::string("MLT_REPOSITORY=") + VELTRANE_MLT_REPOSITORY,
                                          std::string("MLT_DATA=") + VELTRANE_MLT_DATA};
  environment.insert(environment.end(), extra.begin(), extra.end());
  const auto named = [](const std::string& variable) {
    return variable.substr(0, variable.find('=') + 1);
  };
  for (char** entry = environ; *entry; ++entry) {
    const std::string variable = *entry;
    bool replaced = variable.rfind("VELTRANE_PLUGIN=", 0) == 0;
    for (const std::string& given : environment) replaced |= named(given) == named(variable);
    if (!replaced) environment.push_back(variable);
  }
  return environment;
}

int run(const std::vector<std::string>& argv, const std::string& errPath,
        const std::vector<std::string>& extra = {}) {
  const std::vector<std::string> environment = environmentWith(extra);
  testsupport::ChildProcess child(argv, "/dev/null", errPath, &environment);
  return child.wait(120);
}

testsupport::ScratchDirectory& scratch() {
  static testsupport::ScratchDirectory directory;
  return directory;
}

std::string propertyElements(const std::map<std::string, std::string>& properties) {
  std::string text;
  for (const auto& [name, value] : properties)
    text += "<property name=\"" + name + "\">" + value + "</property>";
  return text;
}

}  // namespace

const char* const kLowerGuid = "d3e00000-0000-4000-8000-000000000001";

const Clips& clips() {
  static const Clips made = [] {
    Clips result{scratch().file("upper.mov"), scratch().file("lower.mov"),
                 scratch().file("third.mov"), scratch().file("fourth.mov")};
    const std::string size = std::to_string(kWidth) + "x" + std::to_string(kHeight);
    for (const auto& [path, source] :
         {std::pair{result.upper, "testsrc2"}, std::pair{result.lower, "mandelbrot"},
          std::pair{result.third, "smptebars"}, std::pair{result.fourth, "rgbtestsrc"}}) {
      if (run({"ffmpeg", "-v", "error", "-y", "-f", "lavfi", "-i",
               std::string(source) + "=size=" + size + ":rate=25", "-frames:v",
               std::to_string(kFrames), "-c:v", "png", path},
              scratch().file("ffmpeg.log")) != 0)
        throw std::runtime_error("ffmpeg could not make " + path + ": " +
                                 readText(scratch().file("ffmpeg.log")));
    }
    return result;
  }();
  return made;
}

std::vector<std::string> MeltRun::bridgeLines() const {
  std::vector<std::string> lines;
  std::istringstream text(log);
  for (std::string line; std::getline(text, line);) {
    if (line.find(" veltrane]") != std::string::npos) lines.push_back(line);
  }
  return lines;
}

// How long a melt run may take, counted from its start: many times what the slowest run here
// takes on a busy machine.
constexpr int kLongestSeconds = 120;

MeltJob::MeltJob(const std::string& document, const std::vector<std::string>& environment) {
  writeText(folder_.file("document.mlt"), document);
  std::vector<std::string> variables = environment;
#ifdef VELTRANE_MELT_PRELOAD
  // A sanitized module in melt: the runtime goes first, before what a test preloads, and what
  // MLT itself keeps at exit is not the module's to answer for.
  std::string preload = VELTRANE_MELT_PRELOAD;
  const auto preloads = [](const std::string& variable) {
    return variable.rfind("LD_PRELOAD=", 0) == 0;
  };
  for (const std::string& variable : variables)
    if (preloads(variable)) preload += " " + variable.substr(variable.find('=') + 1);
  variables.erase(std::remove_if(variables.begin(), variables.end(), preloads), variables.end());
  variables.push_back("LD_PRELOAD=" + preload);
  variables.push_back("ASAN_OPTIONS=detect_leaks=0:intercept_tls_get_addr=0");
  // MLT's frei0r module opens every frei0r plug-in installed when it registers; under the
  // sanitizer's dlopen one of them (its libraries' constructors binding message catalogues)
  // deadlocks in the C library before melt reads the document. None is used here.
  const std::string noFrei0r = folder_.file("frei0r");
  std::filesystem::create_directory(noFrei0r);
  variables.push_back("FREI0R_PATH=" + noFrei0r);
#endif
  const std::vector<std::string> whole = environmentWith(variables);
  deadline_ = Clock::now() + std::chrono::seconds(kLongestSeconds);
  // Every frame rendered, however long one takes: a busy machine drops none.
  melt_ = std::make_unique<testsupport::ChildProcess>(
      std::vector<std::string>{"melt", folder_.file("document.mlt"), "-consumer",
                               "avformat:" + folder_.file("out.rgba"), "f=rawvideo",
                               "vcodec=rawvideo", "pix_fmt=rgba", "real_time=-1"},
      "/dev/null", folder_.file("melt.log"), &whole);
}

MeltRun MeltJob::finish() {
  const double left = std::chrono::duration<double>(deadline_ - Clock::now()).count();
  MeltRun result;
  const int status = melt_->wait(std::max(0.0, left));
  const bool ended = melt_->pid() <= 0;
  melt_.reset();  // stops melt if it is still running
  result.log = readText(folder_.file("melt.log"));
  if (!ended)
    result.log +=
        "\n[melt did not end in " + std::to_string(kLongestSeconds) + " s and was stopped]";
  else if (status != 0)
    result.log += "\n[melt's status " + std::to_string(status) + "]";
  const std::string raw = readText(folder_.file("out.rgba"));
  const std::size_t frameBytes = std::size_t(kWidth) * kHeight * 4;
  for (std::size_t at = 0; at + frameBytes <= raw.size(); at += frameBytes) {
    refhost::RgbaImage frame(kWidth, kHeight);
    frame.pixels.assign(raw.begin() + at, raw.begin() + at + frameBytes);
    result.frames.push_back(std::move(frame));
  }
  EXPECT_TRUE(ended && status == 0 && result.frames.size() == std::size_t(kFrames))
      << "melt wrote " << result.frames.size() << " of " << kFrames << " frames\n"
      << result.log;
  return result;
}

MeltRun runMelt(const std::string& document, const std::vector<std::string>& environment) {
  return MeltJob(document, environment).finish();
}

std::string splitScene(const std::vector<std::string>& clips,
                       const std::vector<std::string>& options) {
  testsupport::ScratchDirectory folder;
  std::vector<std::string> argv{VELTRANE_CLI_PATH, "split", "--plugin", VELTRANE_MODULE_PATH};
  argv.insert(argv.end(), clips.begin(), clips.end());
  argv.insert(argv.end(), options.begin(), options.end());
  argv.insert(argv.end(), {"--save-scene", folder.file("scene.json")});
  if (run(argv, folder.file("split.log")) != 0)
    throw std::runtime_error("veltrane split failed: " + readText(folder.file("split.log")));
  return readText(folder.file("scene.json"));
}

std::vector<refhost::RgbaImage> renderScene(const std::string& sceneText) {
  testsupport::ScratchDirectory folder;
  writeText(folder.file("scene.json"), sceneText);
  if (run({VELTRANE_CLI_PATH, "render", "--plugin", VELTRANE_MODULE_PATH, folder.file("scene.json"),
           "-o", folder.file("f_%04d.png")},
          folder.file("render.log")) != 0)
    throw std::runtime_error("veltrane render failed: " + readText(folder.file("render.log")));
  std::vector<refhost::RgbaImage> frames;
  for (int frame = 0;; ++frame) {
    char name[32];
    std::snprintf(name, sizeof name, "f_%04d.png", frame);
    if (!std::ifstream(folder.file(name))) break;
    frames.push_back(refhost::readImageFile(folder.file(name)));
  }
  return frames;
}

int largestDifference(const refhost::RgbaImage& a, const refhost::RgbaImage& b) {
  if (a.width != b.width || a.height != b.height || a.pixels.size() != b.pixels.size())
    return INT_MAX;
  int largest = 0;
  for (std::size_t i = 0; i < a.pixels.size(); ++i)
    largest = std::max(largest, std::abs(int(a.pixels[i]) - int(b.pixels[i])));
  return largest;
}

std::string document(const std::string& name, const std::map<std::string, std::string>& marks) {
  std::string text = readText(std::string(VELTRANE_SOURCE_DIR "/tests/mlt/data/") + name);
  if (text.empty()) throw std::runtime_error("cannot read the test document " + name);
  std::map<std::string, std::string> all = marks;
  all["@LOWER@"] = clips().lower;
  all["@UPPER@"] = clips().upper;
  all["@THIRD@"] = clips().third;
  all["@FOURTH@"] = clips().fourth;
  for (const auto& [mark, value] : all) {
    for (std::size_t at; (at = text.find(mark)) != std::string::npos;)
      text.replace(at, mark.size(), value);
  }
  return text;
}

std::string tractorDocument(const std::map<std::string, std::string>& properties,
                            const std::string& upperTrackProperties) {
  return document("tractor.mlt", {{"@PROPERTIES@", propertyElements(properties)},
                                  {"@UPPER_TRACK@", upperTrackProperties}});
}

std::string filterDocument(const std::map<std::string, std::string>& properties) {
  return document("filter.mlt", {{"@PROPERTIES@", propertyElements(properties)}});
}

std::string scene(const std::string& params) {
  return "{\"width\": " + std::to_string(kWidth) + ", \"height\": " + std::to_string(kHeight) +
         ", \"fps\": 25, \"duration\": " + std::to_string(kFrames) + ", \"source\": {\"file\": \"" +
         clips().upper + "\"}, \"layers\": [{\"guid\": \"" + kLowerGuid +
         "\", \"name\": \"lower\", \"source\": {\"file\": \"" + clips().lower +
         "\"}}], \"params\": {" + params + "}}";
}

}  // namespace mlttest
