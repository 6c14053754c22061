// What the command line leaves when an output is refused, writing fails or it is stopped: one
// line naming the output, nothing new on disk, and every file that was there before as it was.
#include <gtest/gtest.h>
#include <sched.h>
#include <signal.h>
#include <sys/mount.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <filesystem>
#include <map>
#include <nlohmann/json.hpp>
#include <regex>
#include <thread>

#include "cli_runner.h"

namespace {

namespace fs = std::filesystem;
using nlohmann::json;

// Why this process cannot have mounts of its own, or "". As root a mount namespace is enough;
// otherwise a user namespace makes the process root over its own mounts.
std::string enterMountNamespace() {
  if (unshare(CLONE_NEWNS) != 0) {
    std::string uid = std::to_string(getuid()), gid = std::to_string(getgid());
    if (unshare(CLONE_NEWUSER | CLONE_NEWNS) != 0) return std::strerror(errno);
    writeText("/proc/self/setgroups", "deny");
    writeText("/proc/self/uid_map", "0 " + uid + " 1");
    writeText("/proc/self/gid_map", "0 " + gid + " 1");
  }
  // Mounts made here must not show in the namespace the process came from.
  return mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) ? std::strerror(errno) : "";
}

// A tmpfs of that many 4 KiB pages (read-only when asked), seen by this process and the commands
// it starts.
class SmallFileSystem : public ScratchDirectory {
 public:
  explicit SmallFileSystem(std::size_t pages, unsigned long flags = 0) {
    static const std::string failure = enterMountNamespace();
    std::string size = "size=" + std::to_string(pages * 4096);
    if (!failure.empty() || mount("tmpfs", path().c_str(), "tmpfs", flags, size.c_str()) != 0)
      throw std::runtime_error("cannot mount a tmpfs (needs root or user namespaces): " +
                               (failure.empty() ? std::strerror(errno) : failure));
  }
  ~SmallFileSystem() { umount2(path().c_str(), MNT_DETACH); }
};

// Every entry under the folder with its contents ("/" for a folder).
std::map<std::string, std::string> snapshot(const std::string& folder) {
  std::map<std::string, std::string> found;
  for (const auto& entry : fs::recursive_directory_iterator(folder))
    found[entry.path()] = entry.is_directory() ? "/" : slurp(entry.path());
  return found;
}

// Runs `command` (render or interact) on the small scene of `frames` frames and a script of
// `events` pointer moves, with the options' values (every second item) named in `folder`, and
// -y to replace what is there.
CliRun runOn(const std::string& command, int frames, int events,
             const std::vector<std::string>& options, const std::string& folder,
             const std::function<void(int)>& whileRunning = nullptr) {
  ScratchDirectory inputs;
  writeText(inputs.file("events.json"),
            json{{"events", std::vector<json>(events, {{"move", {10, 10}}})}}.dump());
  std::vector<std::string> args{command, writeScene(inputs, smallScene("counter", frames))};
  if (command == "interact") args.insert(args.end(), {"--events", inputs.file("events.json")});
  for (std::size_t i = 0; i < options.size(); ++i)
    args.push_back(i % 2 ? folder + "/" + options[i] : options[i]);
  args.push_back("-y");  // the files there are to be replaced
  return runCli(args, VELTRANE_MODULE_PATH, whileRunning);
}

// What the command printed last, after its progress bar.
std::string lastLine(const std::string& text) {
  return text.substr(text.rfind('\n', text.size() - 2) + 1);
}

TEST(OutputWrites, AFailedWriteIsOneLineAndLeavesWhatWasThere) {
  struct Case {
    std::string command;
    std::vector<std::string> outputs, there;  // files there before; a folder ends in '/'
    std::size_t freePages;                    // of 4 KiB, beyond those the files there take
    std::string error;                        // after the folder, a regular expression
  };
  const std::string n(240, 'n'), full = ": cannot write: No space left on device";
  const Case cases[] = {
      {"render", {"-o", n + ".png"}, {n + ".png"}, 0, n + "\\.png" + full},  // near the name limit
      // Several writers race for the last free pages: any frame may be the first refused.
      {"render", {"-o", n + "%04d.png"}, {n + "0003.png"}, 5, n + "00[0-2][0-9]\\.png" + full},
      {"render", {"-o", "s%d.png"}, {"s1.png", "s2.png/"}, 256, "s2\\.png: is a folder; .*"},
      {"render", {"-o", "v.mp4"}, {"v.mp4"}, 0, "v\\.mp4: cannot write video: .*space.*"},
      {"interact", {"-o", "r"}, {"r"}, 0, "r" + full},
      {"interact", {"-o", "r", "--overlay", "o/v"}, {"r"}, 2, "o/v/event_000[1-9].png" + full},
  };
  for (const Case& c : cases) {
    SmallFileSystem disk(c.there.size() + c.freePages);
    for (const std::string& file : c.there)
      file.back() == '/' ? (void)fs::create_directory(disk.file(file))
                         : writeText(disk.file(file), "old");
    std::map<std::string, std::string> before = snapshot(disk.path());
    CliRun run = runOn(c.command, 30, 4, c.outputs, disk.path());
    EXPECT_EQ(run.status, 1) << c.error;
    std::string line = lastLine(run.err), start = "veltrane " + c.command + ": " + disk.file("");
    EXPECT_TRUE(line.rfind(start, 0) == 0 &&
                std::regex_match(line.substr(start.size()), std::regex(c.error + "\n")))
        << run.err;
    EXPECT_EQ(snapshot(disk.path()), before) << c.error;
  }
}

// Refused before anything is read or written: an input named as the output (through a link, a
// hard link, a pattern), a folder, a place that takes no files, a file there unless -y.
TEST(OutputWrites, RefusedOutputsAreOneLineAndWriteNothing) {
  ScratchDirectory folder;
  const std::string a = folder.file("a.mp4");
  commandOutput("ffmpeg -v error -f lavfi -i testsrc2=size=64x36:rate=25 -t 0.4 -pix_fmt yuv420p " +
                a);
  writeText(folder.file("layer.png"), slurp(a));  // any bytes: refused before it is read
  json scene = smallScene("bars", 2);
  scene["layers"][0]["source"] = {{"file", "layer.png"}};
  const std::string scenePath = writeScene(folder, scene);
  fs::create_symlink("a.mp4", folder.file("link.mp4"));
  fs::create_hard_link(folder.file("layer.png"), folder.file("f0001.png"));
  fs::create_directory(folder.file("folder.png"));
  writeText(folder.file("there.png"), "old");
  writeText(folder.file("events.json"), R"({"events": []})");
  SmallFileSystem readOnly(16, MS_RDONLY);
  const std::string link = folder.file("link.mp4"), there = folder.file("there.png"),
                    events = folder.file("events.json"), blocked = readOnly.file("new/out.mp4");
  struct Case {
    std::vector<std::string> args;
    int status;
    std::string line;  // the one line on stderr after the command's name, from its start
  };
  auto refused = [](std::vector<std::string> args, int status, std::string line) {
    return Case{std::move(args), status, std::move(line)};
  };
  const Case cases[] = {
      refused({"split", a, "pattern:bars", "-o", link}, 2,
              "option '-o': " + link + " is the input " + a),
      refused({"split", a, "pattern:bars", "-o", folder.file("o.png"), "--save-scene", a}, 2,
              "option '--save-scene': " + a + " is the input " + a),
      refused(
          {"render", scenePath, "-o", folder.file("f%04d.png")}, 2,
          "option '-o': " + folder.file("f%04d.png") + " is the input " + folder.file("layer.png")),
      refused({"interact", scenePath, "--events", events, "-o", events}, 2,
              "option '-o': " + events + " is the input"),
      refused({"split", a, "-o", folder.file("folder.png")}, 1,
              folder.file("folder.png") + ": is a folder; -o names a file"),
      refused({"split", a, "-o", blocked}, 1,
              blocked + ": cannot write in " + readOnly.path() + ": Read-only file system"),
      refused({"split", a, "-o", there}, 2, there + " exists; give -y to replace or -n"),
      refused({"split", a, "-o", there, "-n"}, 1, there + " exists; kept as -n asks"),
      refused({"split", a, "-o", there, "-y", "-n"}, 2,
              "give -y (replace outputs) or -n (keep them), not both"),
  };
  const std::map<std::string, std::string> before = snapshot(folder.path());
  for (const Case& c : cases) {
    CliRun run = runCli(c.args);
    EXPECT_EQ(run.status, c.status) << c.line;
    EXPECT_EQ(run.err.rfind("veltrane " + c.args[0] + ": " + c.line, 0), 0u) << run.err;
    EXPECT_EQ(std::count(run.err.begin(), run.err.end(), '\n'), 1) << run.err;
    EXPECT_EQ(snapshot(folder.path()), before) << c.line;
    EXPECT_TRUE(fs::is_empty(readOnly.path()));
  }
  CliRun replaced = runCli({"split", a, "-o", there, "-y"});
  EXPECT_EQ(replaced.status, 0) << replaced.err;
  EXPECT_NE(slurp(there), "old");
}

// Sends the signal once the command has written into a temporary, and had a moment more.
std::function<void(int)> signalPartWay(const std::string& folder, int signal) {
  return [folder, signal](int pid) {
    bool written = false;  // within a minute
    for (int tries = 0; !written && tries < 6000; ++tries) {
      std::this_thread::sleep_for(std::chrono::milliseconds(10));
      std::error_code error;  // the command may remove a folder while it is being listed
      for (fs::recursive_directory_iterator it(folder, error), end; !error && it != end;
           it.increment(error))
        written |= it->is_regular_file(error) &&
                   it->path().string().find(".partial-") != std::string::npos;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(300));
    kill(pid, signal);
  };
}

TEST(StopSignals, StopCleanlyWithTheSignalsExitStatus) {
  struct Case {
    int signal;
    std::string name, command;
    std::vector<std::string> outputs;
  } const cases[] = {{SIGINT, "SIGINT", "render", {"-o", "s_%04d.png"}},
                     {SIGTERM, "SIGTERM", "render", {"-o", "v.mp4"}},
                     {SIGHUP, "SIGHUP", "interact", {"-o", "r.json", "--overlay", "ov"}}};
  for (const Case& c : cases) {
    ScratchDirectory folder;
    for (const char* name : {"s_0001.png", "v.mp4", "r.json"}) writeText(folder.file(name), "old");
    std::map<std::string, std::string> before = snapshot(folder.path());
    CliRun run = runOn(c.command, 100000, 5000, c.outputs, folder.path(),
                       signalPartWay(folder.path(), c.signal));
    EXPECT_EQ(run.status, 128 + c.signal) << c.name;
    EXPECT_EQ(lastLine(run.err),
              "veltrane " + c.command + ": stopped by " + c.name + "; nothing was written\n");
    EXPECT_EQ(snapshot(folder.path()), before) << c.name;
  }
}

TEST(StopSignals, TemporariesOfAKilledRenderGoOnTheNextRun) {
  ScratchDirectory folder;
  std::vector<std::string> output{"-o", "s_%04d.png"};
  runOn("render", 100000, 0, output, folder.path(), signalPartWay(folder.path(), SIGKILL));
  ASSERT_EQ(folder.entries().size(), 1u);  // the hidden folder of frames
  EXPECT_EQ(runOn("render", 2, 0, output, folder.path()).status, 0);
  EXPECT_EQ(folder.entries(), (std::vector<std::string>{"s_0000.png", "s_0001.png"}));
}

}  // namespace
