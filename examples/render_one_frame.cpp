// The smallest front end of the engine: loads the plug-in module, gives it a frame of its own
// making, sets two parameters, renders one frame and writes it as a PNG. A new host front end
// (a bridge to another editor's framework) needs no more of the reference host than this.
//
//   render_one_frame MODULE.so OUT.png
#include <cstdio>
#include <exception>
#include <vector>

#include "refhost/engine.h"
#include "refhost/gl/headless_context.h"
#include "refhost/media/image_files.h"
#include "refhost/pipeline/frame_readback.h"

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fprintf(stderr, "usage: render_one_frame MODULE.so OUT.png\n");
    return 2;
  }
  try {
    refhost::EngineOptions options;
    options.makeContext = refhost::makeHeadlessContext;
    options.modulePath = argv[1];
    refhost::Engine engine(std::move(options));  // loads the module, makes a headless context
    refhost::FrameSettings settings;             // 8-bit frames, square pixels
    settings.width = 320;
    settings.height = 180;
    settings.frameRate = 25.0;
    engine.setFrameSettings(settings);

    // The effect's own source: whatever the front end decodes, here a horizontal ramp, handed
    // over as RGBA rows from the bottom up, as GL stores them.
    engine.setSourceFrames([](int32_t, int32_t width, int32_t height, refhost::PixelFormat) {
      std::vector<uint8_t> rows(static_cast<std::size_t>(width) * height * 4);
      for (std::size_t i = 0; i < rows.size(); i += 4) {
        const auto x = static_cast<uint8_t>((i / 4) % width * 255 / (width - 1));
        rows[i] = x;
        rows[i + 1] = 255 - x;
        rows[i + 2] = 128;
        rows[i + 3] = 255;
      }
      return rows;
    });

    engine.start();  // the module declares its parameter panel
    engine.setParam("borderWidth", refhost::ParamValue::ofFloat(8));
    engine.setParam("borderColor", refhost::ParamValue::ofColor(1, 1, 1));
    engine.createInstance();  // the instance and its GL programs; the values are reported

    std::unique_ptr<refhost::RenderFrame> frame = engine.render(0);
    const WispRenderContext& context = frame->context();
    refhost::writeImageFile(refhost::readBack(context.output.id, context.width, context.height),
                            argv[2], refhost::ImageFormat::Png);
    engine.finish();
    std::printf("wrote %s\n", argv[2]);
    return 0;
  } catch (const std::exception& error) {
    std::fprintf(stderr, "render_one_frame: %s\n", error.what());
    return 1;
  }
}
