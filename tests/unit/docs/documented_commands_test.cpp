// Every command of README.md's and docs/*.md's shell blocks runs as printed, in order, in a copy of
// the checkout and its build; long ones until their first result, a few left out with a reason.
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>

#include "support/child_process.h"
#include "support/files.h"
#include "support/temp_paths.h"

namespace {

namespace fs = std::filesystem;
using testsupport::ChildProcess;
using testsupport::ScratchDirectory;
using testsupport::slurp;

const fs::path kSource = VELTRANE_SOURCE_DIR;
const fs::path kBuild = fs::path(VELTRANE_CLI_PATH).parent_path().parent_path();

struct Treatment {
  const char* command;  // how the command starts (a regular expression)
  enum { Skipped, UntilFirstResult } how;
  const char* detail;  // why it is skipped, or the first result's line (a regular expression)
};

const Treatment kTreatments[] = {
    {"scripts/(demo|test|bench|bench-job|coverage|deps|build-windows)\\b|BENCH_JOB_DIR=",
     Treatment::Skipped, "installs packages through scripts/deps: needs root"},
    {"sudo ", Treatment::Skipped, "needs root"},
    {"melt lower\\.mp4 -track", Treatment::Skipped,
     "needs the module installed into MLT's folders (sudo cmake --install build)"},
    {"xvfb-run -a -s .* ctest --test-dir build-windows", Treatment::Skipped,
     "needs build-windows/, which scripts/build-windows makes (root: it installs packages)"},
    {"(xvfb-run -a )?build/bin/veltrane view|bench/viewer_drag\\.sh", Treatment::Skipped,
     "opens a window"},
    {"build/bin/veltrane bench", Treatment::UntilFirstResult,
     "^[0-9]+x[0-9]+ +[0-9]+ +[a-z]+ +[0-9]"},
    {"build/bin/bench_floor", Treatment::UntilFirstResult, "^[0-9]+x[0-9]+ +[0-9]+ +[0-9]"},
    {"build/bin/bench_geometry", Treatment::UntilFirstResult, "[0-9] (ns|us|ms) +[0-9]"},
    {"build/bin/veltrane soak", Treatment::UntilFirstResult, "^ +[0-9]+ +[0-9]+\\.[0-9]$"},
    {"ctest --test-dir build -L", Treatment::UntilFirstResult, "Test +#[0-9]+: .*Passed"},
    {"bench/melt_job\\.sh", Treatment::UntilFirstResult, "^== (tracks )?run 1 of"},
    {"kubectl ", Treatment::Skipped, "needs a Kubernetes cluster"},
    {"examples/farm/submit-slurm\\.sh|.* /shared/", Treatment::Skipped,
     "needs a Slurm cluster and its shared folder (tests/farm/slurm_cluster.sh starts one)"}};

// Clips the commands name as the reader's own (README.md makes its own): 8 s at 25 fps, with
// sound, small.
const char* const kReadersClips[] = {"lower.mp4",   "upper.mp4",   "clip.mp4",    "in0.mp4",
                                     "in1.mp4",     "uhd10-0.mp4", "uhd10-1.mp4", "uhd10-2.mp4",
                                     "uhd10-3.mp4", "uhd10-4.mp4", "uhd10-5.mp4", "uhd10-6.mp4",
                                     "uhd10-7.mp4", "uhd10-8.mp4"};

struct Command {
  int line = 0;  // in its document
  std::string text;
};

// The commands of the document's shell blocks, continuation lines joined, comments left out.
std::vector<Command> commandsOf(const std::string& document) {
  std::vector<Command> commands;
  std::istringstream in(slurp(kSource / document));
  bool inBlock = false;
  int number = 0;
  for (std::string line; std::getline(in, line);) {
    ++number;
    if (line.rfind("```", 0) == 0) {
      inBlock = !inBlock && std::regex_match(line, std::regex("```(sh|bash|shell)"));
      continue;
    }
    const bool continued =
        !commands.empty() && !commands.back().text.empty() && commands.back().text.back() == '\\';
    if (!inBlock) continue;
    if (continued) {
      commands.back().text += "\n" + line;
    } else if (const auto start = line.find_first_not_of(' ');
               start != std::string::npos && line[start] != '#') {
      commands.push_back({number, line});
    }
  }
  return commands;
}

const Treatment* treatmentOf(const Command& command) {
  for (const Treatment& treatment : kTreatments)
    if (std::regex_search(command.text, std::regex(treatment.command),
                          std::regex_constants::match_continuous))
      return &treatment;
  return nullptr;
}

// A bash script that runs the commands one after the other in one shell (an export holds for
// those after it), each command's output in out.N and its exit status in status.N.
std::string scriptFor(const std::vector<Command>& commands, const fs::path& folder) {
  std::string script = "cd '" + folder.string() + "' || exit 1\n" + R"bash(
# Runs cmd.N in a process group of its own until a line of its output matches, then stops it
# as Ctrl-C would. Its programs write their output a line at a time, as on a terminal.
untilFirstResult() {
  ( setsid bash -c 'echo $$ > "group.$1"; exec stdbuf -oL bash "cmd.$1"' _ "$1" > "out.$1" 2>&1 < /dev/null
    echo $? > "done.$1" ) &
  for ((t = 0; t < 3000; ++t)); do
    if [[ -e done.$1 ]]; then cp "done.$1" "status.$1"; return; fi
    if grep -qE "$2" "out.$1"; then
      kill -INT -- "-$(cat "group.$1")"; wait; echo 0 > "status.$1"; return
    fi
    sleep 0.1
  done
  kill -KILL -- "-$(cat "group.$1")"; wait; echo "no result in 5 minutes" > "status.$1"
}
)bash";
  for (std::size_t i = 0; i < commands.size(); ++i) {
    const Treatment* treatment = treatmentOf(commands[i]);
    const std::string n = std::to_string(i);
    if (treatment && treatment->how == Treatment::Skipped) continue;
    if (treatment) {
      std::ofstream(folder / ("cmd." + n)) << commands[i].text << "\n";
      script += "untilFirstResult " + n + " '" + treatment->detail + "'\n";
    } else {
      script += "{ " + commands[i].text + "\n} > out." + n +
                " 2>&1 < /dev/null; echo $? > status." + n + "\n";
    }
  }
  return script;
}

// The checkout as a reader has it, its build included, in a folder of its own. The build's
// Testing folder is the folder's own, so that the test runs it starts keep their logs apart
// from those of the run this test is part of.
void layOutCheckout(const fs::path& folder, const fs::path& clips) {
  for (const auto& entry : fs::directory_iterator(kSource)) {
    const std::string name = entry.path().filename().string();
    if (name != "build" && name != ".git") fs::create_symlink(entry.path(), folder / name);
  }
  fs::create_directory(folder / "build");
  for (const auto& entry : fs::directory_iterator(kBuild))
    if (entry.path().filename() != "Testing")
      fs::create_symlink(entry.path(), folder / "build" / entry.path().filename());
  for (const char* clip : kReadersClips) fs::create_symlink(clips / clip, folder / clip);
}

std::vector<std::string> documentsWithCommands() {
  std::vector<std::string> documents{"README.md"};
  for (const auto& entry : fs::directory_iterator(kSource / "docs"))
    if (entry.path().extension() == ".md")
      documents.push_back("docs/" + entry.path().filename().string());
  std::sort(documents.begin(), documents.end());
  // Documents whose commands are all left out (viewer.md's open windows) have nothing to run.
  auto nothingToRun = [](const std::string& document) {
    const std::vector<Command> commands = commandsOf(document);
    return std::all_of(commands.begin(), commands.end(), [](const Command& command) {
      const Treatment* treatment = treatmentOf(command);
      return treatment && treatment->how == Treatment::Skipped;
    });
  };
  documents.erase(std::remove_if(documents.begin(), documents.end(), nothingToRun),
                  documents.end());
  return documents;
}

class DocumentedCommands : public ::testing::TestWithParam<std::string> {
 protected:
  static void SetUpTestSuite() {
    clips_ = new ScratchDirectory;
    for (const char* clip : kReadersClips) {
      ChildProcess ffmpeg({"ffmpeg", "-v", "error", "-f", "lavfi", "-i",
                           "testsrc2=size=160x90:rate=25", "-f", "lavfi", "-i",
                           "sine=frequency=440", "-t", "8", "-pix_fmt", "yuv420p",
                           clips_->file(clip)});
      ASSERT_EQ(ffmpeg.wait(60), 0) << clip;
    }
  }
  static void TearDownTestSuite() { delete clips_; }
  static ScratchDirectory* clips_;
};
ScratchDirectory* DocumentedCommands::clips_ = nullptr;

TEST_P(DocumentedCommands, RunAsPrinted) {
  const std::vector<Command> commands = commandsOf(GetParam());
  ScratchDirectory folder;
  layOutCheckout(folder.path(), clips_->path());
  std::ofstream(folder.file("commands.sh")) << scriptFor(commands, folder.path());
  // As a reader's shell: no module named, no display to open windows on.
  std::vector<std::string> environment = testsupport::environmentWithout(
      {"VELTRANE_PLUGIN", "DISPLAY", "WAYLAND_DISPLAY", "BUILD_DIR"});
  // The scripts build where the tests' build is, as a reader building elsewhere tells them.
  environment.push_back("BUILD_DIR=" + kBuild.string());
  ChildProcess shell({"bash", folder.file("commands.sh")}, folder.file("shell.out"),
                     folder.file("shell.out"), &environment);
  ASSERT_EQ(shell.wait(1200), 0) << slurp(folder.file("shell.out"));
  for (std::size_t i = 0; i < commands.size(); ++i) {
    const Treatment* treatment = treatmentOf(commands[i]);
    if (treatment && treatment->how == Treatment::Skipped) continue;
    const std::string n = std::to_string(i);
    const std::string output = slurp(folder.file("out." + n));
    EXPECT_EQ(slurp(folder.file("status." + n)), "0\n")
        << GetParam() << ":" << commands[i].line << ": " << commands[i].text << "\n"
        << output.substr(output.size() > 2000 ? output.size() - 2000 : 0);
  }
}

INSTANTIATE_TEST_SUITE_P(Docs, DocumentedCommands, ::testing::ValuesIn(documentsWithCommands()),
                         [](const ::testing::TestParamInfo<std::string>& info) {
                           std::string name = fs::path(info.param).stem().string();
                           for (char& c : name)
                             if (!std::isalnum(static_cast<unsigned char>(c))) c = '_';
                           return name;
                         });

}  // namespace
