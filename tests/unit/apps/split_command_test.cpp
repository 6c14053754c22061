// `veltrane split` end to end: what it renders is what `render` makes of the scene it saves; clips
// are read as FFmpeg reads them; bad input is one line with status 2 and nothing written.
#include <gtest/gtest.h>

#include <filesystem>
#include <nlohmann/json.hpp>
#include <sstream>

#include "cli_runner.h"
#include "refhost/media/image_files.h"
#include "support/spoiled_media.h"

namespace {

using nlohmann::json;

// Small clips made with FFmpeg's test sources: 1 s at 25 fps unless told.
std::string clip(const ScratchDirectory& folder, const std::string& name, const std::string& size,
                 const std::string& source = "testsrc2", int seconds = 1) {
  const std::string path = folder.file(name);
  commandOutput("ffmpeg -v error -y -f lavfi -i " + source + "=size=" + size + ":rate=25 -t " +
                std::to_string(seconds) + " -pix_fmt yuv420p " + path);
  return path;
}

// Frames 0 to 4 as PNGs, by split and by render of the scene split saved: the same bytes.
void expectTheSceneItSavesRendersTheSame(const ScratchDirectory& folder,
                                         const std::vector<std::string>& clipsAndOptions) {
  std::vector<std::string> args{"split"};
  args.insert(args.end(), clipsAndOptions.begin(), clipsAndOptions.end());
  args.insert(args.end(), {"-o", folder.file("split/f%04d.png"), "--frames", "0-4", "--save-scene",
                           folder.file("saved/split.json")});
  CliRun split = runCli(args);
  ASSERT_EQ(split.status, 0) << split.err;
  CliRun render = runCli({"render", folder.file("saved/split.json"), "-o",
                          folder.file("render/f%04d.png"), "--frames", "0-4"});
  ASSERT_EQ(render.status, 0) << render.err;
  for (int frame = 0; frame < 5; ++frame) {
    const std::string name = "/f000" + std::to_string(frame) + ".png";
    EXPECT_EQ(slurp(folder.file("split") + name), slurp(folder.file("render") + name)) << name;
  }
}

TEST(SplitCommand, RendersWhatTheSceneItSavesRenders) {
  ScratchDirectory folder;
  const std::string a = clip(folder, "a.mp4", "160x90"), b = clip(folder, "b.mp4", "160x90");
  expectTheSceneItSavesRendersTheSame(folder, {a, b, "--border", "4,ff8000"});
  const json saved = json::parse(slurp(folder.file("saved/split.json")));
  EXPECT_EQ(saved["width"], 160);
  EXPECT_EQ(saved["fps"], 25.0);
  EXPECT_EQ(saved["duration"], 25);
  EXPECT_EQ(saved["source"]["file"], a);
  EXPECT_EQ(saved["params"]["borderWidth"], 4.0);

  // Four of different proportions (a portrait clip, a still), each framed on its region.
  ScratchDirectory four;
  const std::string portrait = clip(four, "p.mp4", "90x160", "testsrc");
  const std::string still = four.file("still.png");
  commandOutput("ffmpeg -v error -y -f lavfi -i smptebars=size=120x90 -frames:v 1 " + still);
  expectTheSceneItSavesRendersTheSame(
      four, {clip(four, "a.mp4", "160x90"), portrait, still, clip(four, "c.mp4", "160x90"),
             "--nudge", "2:5,-5,110,10"});
  const json params = json::parse(slurp(four.file("saved/split.json")))["params"];
  EXPECT_EQ(params["numberOfCuts"], 3) << "four clips make a 2x2 grid";
  // The portrait clip is shown at its own proportions: framing scales its narrow picture up.
  bool portraitFramed = false;
  for (int j = 0; j < 9; ++j) {
    const std::string n = std::to_string(j);
    if (params.value("inputLayer" + n, "") != "5b1170e0-0000-4000-8000-000000000001") continue;
    portraitFramed = params["inputFrameScale" + n].get<double>() > 100;
    EXPECT_EQ(params["inputFrameRotation" + n], 10.0);
  }
  EXPECT_TRUE(portraitFramed) << params;
}

// Layouts filled again, the first video's nominal rate or a still's note, --fps, damage concealed
// or refused: every message one line of our own, whatever the libraries would have printed.
TEST(SplitCommand, ReadsClipsAsFfmpegDoes) {
  ScratchDirectory folder;
  const std::string a = clip(folder, "a.mp4", "160x90"),
                    damaged = clip(folder, "bad.mp4", "160x90");
  testsupport::spoilPacket(damaged, 14, testsupport::Spoiling::CutInHalf);
  const std::string dropped = folder.file("dropped.mp4"), photo = folder.file("photo.jpg");
  commandOutput(
      "ffmpeg -v error -f lavfi -i testsrc2=size=64x36:rate=30 -t 2 -vf "
      "\"select='not(eq(mod(n,20),19))'\" -fps_mode passthrough " +
      dropped);
  commandOutput("ffmpeg -v error -f lavfi -i testsrc2=size=160x90 -frames:v 1 " + photo);
  testsupport::tagExifOrientation(photo, 6);
  commandOutput("ffmpeg -v error -f lavfi -i testsrc2=size=160x90 -frames:v 1 " +
                folder.file("whole.png"));
  const std::string png = slurp(folder.file("whole.png")), spoilt = folder.file("spoilt.png");
  writeText(spoilt, png.substr(0, png.size() / 2) + std::string(64, '\0') +
                        png.substr(png.size() / 2 + 64));
  const std::string out = folder.file("out.mp4");
  struct Case {
    std::vector<std::string> args;
    int status;
    std::string line;   // one of the lines on stderr starts with it, after the command's name
    const char* shown;  // width, height and rate of the video written
  };
  auto split = [](std::vector<std::string> args, int status, std::string line, const char* shown) {
    return Case{std::move(args), status, std::move(line), shown};
  };
  const Case cases[] = {
      split({a, "pattern:checker", "--layout", "grid"}, 0,
            "note: grid-2x2 shows 4 pictures; the 2 clips given fill them again in order",
            "160,90,25/1"),
      split({dropped}, 0, "", "64,36,30/1"),
      split({photo, a}, 0,
            "note: clip 1 (photo.jpg) is a still: the frames run at 25 fps, the rate of clip 2 "
            "(a.mp4); --fps R sets another rate",
            "90,160,25/1"),
      split({a, "--fps", "29.97"}, 0, "", "160,90,30000/1001"),
      split({a, "--fps", "30000/1001"}, 0, "", "160,90,30000/1001"),
      split({damaged}, 0,
            "warning: damaged frames were shown as the decoder concealed them: clip 1 (bad.mp4): "
            "frame ",
            "160,90,25/1"),
      split({damaged, "--strict"}, 1, "clip 1 (bad.mp4): frame ", nullptr),
      split({spoilt}, 2,
            "argument '" + spoilt +
                "': expected a video or image file that shows a picture (cannot read image: its "
                "data is damaged (",
            nullptr),
      split({a, "--fps", "30/0"}, 2, "option '--fps' expects a rate from 0.001 to 1000", nullptr),
  };
  for (const auto& c : cases) {
    std::vector<std::string> args{"split"};
    args.insert(args.end(), c.args.begin(), c.args.end());
    args.insert(args.end(), {"-o", out, "--frames", "0-24", "--no-audio", "--quiet", "-y"});
    std::filesystem::remove(out);
    CliRun run = runCli(args);
    SCOPED_TRACE(c.line + "\n" + run.err);
    EXPECT_EQ(run.status, c.status);
    std::istringstream lines(run.err);
    bool found = c.line.empty();
    for (std::string line; std::getline(lines, line);) {
      EXPECT_EQ(line.rfind("veltrane split: ", 0), 0u) << line;
      found = found || line.rfind("veltrane split: " + c.line, 0) == 0;
    }
    EXPECT_TRUE(found);
    EXPECT_EQ(std::filesystem::exists(out), c.shown != nullptr);
    if (c.shown) {
      EXPECT_EQ(commandOutput("ffprobe -v error -show_entries stream=width,height,r_frame_rate "
                              "-of csv=p=0 " +
                              out),
                std::string(c.shown) + "\n");
    }
  }
}

// A clip trimmed to start a second into its file shows at frame 0 what it shows untrimmed at
// 1.0 s, frame 25: the scene's start reaches the frames the composition asks the file for.
TEST(SplitCommand, ATrimmedClipStartsLaterInItsFile) {
  ScratchDirectory folder;
  const std::string a = clip(folder, "a.mp4", "160x90", "testsrc2", 2);
  CliRun trimmed = runCli({"split", a, "pattern:bars", "--trim", "1:1", "--frame", "0", "-o",
                           folder.file("trimmed.png"), "--save-scene", folder.file("t.json")});
  ASSERT_EQ(trimmed.status, 0) << trimmed.err;
  CliRun later =
      runCli({"split", a, "pattern:bars", "--frame", "1.0", "-o", folder.file("at1.png")});
  ASSERT_EQ(later.status, 0) << later.err;
  EXPECT_EQ(slurp(folder.file("trimmed.png")), slurp(folder.file("at1.png")));
  const json saved = json::parse(slurp(folder.file("t.json")));
  EXPECT_EQ(saved["source"]["start"], 1.0);
  EXPECT_EQ(saved["duration"], 25) << "the two-second clip has a second left";
}

TEST(SplitCommand, RefusesBadInputWithOneLineAndWritesNothing) {
  ScratchDirectory folder;
  const std::string a = clip(folder, "a.mp4", "160x90");
  writeText(folder.file("text.mp4"), "not a video");
  commandOutput("ffmpeg -v error -y -f lavfi -i sine=frequency=440 -t 0.5 " +
                folder.file("sound.mp4"));
  const std::string out = folder.file("out.png");
  struct Case {
    std::vector<std::string> args;
    std::string line;  // in the one line on stderr, after the command's name
  };
  auto refused = [&](std::vector<std::string> args, const std::string& line) {
    args.insert(args.begin(), "split");
    args.insert(args.end(), {"-o", out});
    return Case{args, line};
  };
  const std::string shows = "': expected a video or image file that shows a picture";
  const Case cases[] = {
      refused({a, folder.file("missing.mp4")},
              "argument '" + folder.file("missing.mp4") +
                  "': expected a video or image file, and there is no such file"),
      refused({folder.file("text.mp4")}, "argument '" + folder.file("text.mp4") + shows),
      refused({a, folder.file("sound.mp4")}, "argument '" + folder.file("sound.mp4") + shows),
      refused(std::vector<std::string>(10, a), "expects 1 to 9 clips, got 10"),
      refused({a, a, a, "--layout", "diagonal-2"},
              "option '--layout': diagonal-2 shows 2 pictures, fewer than the 3 clips"),
      refused({a, "--layout", "zigzag"},
              "option '--layout': expected one of diagonal-2, vertical-2, horizontal-2, slanted-2"),
      refused({a, a, "--layout", "diagnal"}, "got 'diagnal'; did you mean 'diagonal'?"),
      refused({a, a, "--bordr", "4"}, "unknown option '--bordr'; did you mean '--border'?"),
      refused({a, a, "--nudge", "3:0,0"},
              "option '--nudge': expected a clip number from 1 to 2, got 3"),
      refused({a, a, "--frame", "2:0,40"},
              "option '--frame' takes the frame to render (N, or a time); a clip's picture is "
              "moved with --nudge 2:0,40"),
      refused({a, "pattern:bars", "--trim", "2:1"},
              "option '--trim': clip 2 (bars) is a still picture"),
      refused({a, "--trim", "1:5"},
              "option '--trim': clip 1 (a) lasts 1 s; a start of 5 s lies past its end"),
      refused({a, a, "--gap", "20"},
              "option '--gap': the cuts of diagonal-2 do not run side by side"),
      refused({a, "--border", "4,mauve"}, "option '--border' expects a colour as RRGGBB or a name"),
      {{"split", a}, "needs -o OUT (or --save-scene FILE.json alone)"}};
  for (const Case& c : cases) {
    CliRun run = runCli(c.args);
    EXPECT_EQ(run.status, 2) << c.line << "\n" << run.err;
    EXPECT_EQ(run.err.rfind("veltrane split: ", 0), 0u) << run.err;
    EXPECT_NE(run.err.find(c.line), std::string::npos) << run.err;
    EXPECT_EQ(std::count(run.err.begin(), run.err.end(), '\n'), 1) << run.err;
    EXPECT_FALSE(std::filesystem::exists(out)) << c.line;
  }
}

}  // namespace
