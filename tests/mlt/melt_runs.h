// Running melt on MLT documents with the uninstalled bridge, and `veltrane render` on the
// scenes they should equal, for the bridge's tests.
#pragma once

#include <chrono>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "refhost/media/rgba_image.h"
#include "support/child_process.h"
#include "support/temp_paths.h"

namespace mlttest {

// Every picture is this small so that the suite stays fast (the documents in data/ say the
// same).
constexpr int kWidth = 160;
constexpr int kHeight = 90;
constexpr int kFrames = 20;

// Two 20-frame clips stored losslessly as RGB (PNG in QuickTime), made once with FFmpeg's test
// sources, so that melt and the reference host read exactly the same pixels: `upper` changes
// every frame (a time shift shows), `lower` is another picture; `third` and `fourth` fill the
// tracks of a four-way split.
struct Clips {
  std::string upper;
  std::string lower;
  std::string third;
  std::string fourth;
};
const Clips& clips();

struct MeltRun {
  std::string log;                         // what melt wrote to standard error
  std::vector<refhost::RgbaImage> frames;  // the raw RGBA it rendered
  // The log lines that mention the bridge's services.
  std::vector<std::string> bridgeLines() const;
};

// melt rendering `document` (MLT XML) to raw RGBA at the document's profile size, started in
// the background so that several can run at once, MLT_REPOSITORY and MLT_DATA pointing at the
// build tree's module folders; `environment` holds more NAME=value variables for melt.
class MeltJob {
 public:
  explicit MeltJob(const std::string& document, const std::vector<std::string>& environment = {});

  // Waits for melt. A run that does not end by itself within two minutes of its start, with
  // status 0 and every frame written, fails the calling test, with melt's log.
  MeltRun finish();

 private:
  using Clock = std::chrono::steady_clock;
  testsupport::ScratchDirectory folder_;
  Clock::time_point deadline_;
  std::unique_ptr<testsupport::ChildProcess> melt_;
};

// A melt job, waited for.
MeltRun runMelt(const std::string& document, const std::vector<std::string>& environment = {});

// The scene `veltrane split` makes of `clips` (the first the own source) with `options`
// (e.g. {"--layout", "grid-2x2"}), as its --save-scene writes it.
std::string splitScene(const std::vector<std::string>& clips,
                       const std::vector<std::string>& options);

// Renders `scene` (a scene document) with `veltrane render`, every frame.
std::vector<refhost::RgbaImage> renderScene(const std::string& scene);

// The largest difference of any channel of any pixel; INT_MAX for pictures of other sizes.
int largestDifference(const refhost::RgbaImage& a, const refhost::RgbaImage& b);

// The MLT documents in data/ with the clips' files and the marks (@NAME@ -> text) filled in.
std::string document(const std::string& name, const std::map<std::string, std::string>& marks = {});

// data/tractor.mlt: the clips in a tractor (the lower track 0, the upper track 1) with the
// transition and `properties`, and `upperTrackProperties` (property elements) on the upper
// track's playlist.
std::string tractorDocument(const std::map<std::string, std::string>& properties,
                            const std::string& upperTrackProperties = "");

// data/filter.mlt: one track (the upper clip) with the filter and `properties`.
std::string filterDocument(const std::map<std::string, std::string>& properties);

// A scene for the reference host: the upper clip as the own source, the lower clip as the layer
// the bridge calls "lower", and `params` (JSON members) as the parameters.
std::string scene(const std::string& params);

// The GUID the scene gives the lower clip's layer.
extern const char* const kLowerGuid;

}  // namespace mlttest
