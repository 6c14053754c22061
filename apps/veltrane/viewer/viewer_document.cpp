// Saving, Save As, the unsaved-changes question and background renders.
#include "viewer/viewer_document.h"

#define GLFW_INCLUDE_NONE
#include <GLFW/glfw3.h>
#include <stdlib.h>

#include <cstdio>
#include <filesystem>
#include <utility>

#include "cli/output_safety.h"

namespace veltrane_viewer {
namespace {

namespace fs = std::filesystem;

std::string quotedList(const std::vector<std::string>& steps) {
  std::string list;
  for (const std::string& step : steps) list += (list.empty() ? "\"" : ", \"") + step + "\"";
  return list.empty() ? std::string("none") : list;
}

}  // namespace

ViewerDocument::ViewerDocument(ViewerSession& session, const veltrane_cli::Scene& scene,
                               std::string savePath, std::string modulePath)
    : session_(session),
      inputs_(veltrane_cli::mediaFilesOf(scene.composition)),
      savePath_(savePath.empty() ? scene.file : std::move(savePath)),
      modulePath_(std::move(modulePath)) {
  const fs::path stem = fs::path(savePath_).replace_extension(".mp4");
  setField(render_.output, stem.string());
}

ViewerDocument::~ViewerDocument() {
  running_.reset();  // stops a render still running before its scene copy goes
  std::error_code ignored;
  if (!renderFolder_.empty()) fs::remove_all(renderFolder_, ignored);
}

bool ViewerDocument::saveTo(const std::string& path) {
  try {
    veltrane_cli::refuseInputAsOutput("", path, inputs_);
    session_.save(path);
  } catch (const std::exception& error) {
    session_.setStatus(error.what(), true);
    std::fprintf(stderr, "veltrane view: %s\n", error.what());
    return false;
  }
  session_.setStatus("saved " + path, false);
  // What was saved and the edits that led to it, for the terminal the viewer runs in.
  std::printf("saved %s; undo history: %s; undone: %s\n", path.c_str(),
              quotedList(session_.engine().undoStepNames()).c_str(),
              quotedList(session_.engine().redoStepNames()).c_str());
  std::fflush(stdout);
  return true;
}

bool ViewerDocument::save() { return saveTo(savePath_); }

void ViewerDocument::openSaveAs() {
  setField(saveAs_.path, savePath_);
  saveAs_.problem.clear();
  saveAs_.confirmingReplace = false;
  saveAs_.open = true;
}

void ViewerDocument::openRender() {
  if (running_) return;
  render_.problem.clear();
  render_.open = true;
}

void ViewerDocument::requestQuit() {
  if (!session_.modified()) {
    quitting_ = true;
    return;
  }
  prompt_.document = fs::path(savePath_).filename().string();
  prompt_.open = true;
}

bool ViewerDocument::dialogKey(int glfwKey) {
  if (prompt_.open) {
    if (glfwKey == GLFW_KEY_S || glfwKey == GLFW_KEY_ENTER) {
      prompt_.open = false;
      quitting_ = save();
    } else if (glfwKey == GLFW_KEY_D) {
      prompt_.open = false;
      quitting_ = true;
      std::fprintf(stderr, "veltrane view: closed without saving the changes\n");
    } else if (glfwKey == GLFW_KEY_ESCAPE) {
      prompt_.open = false;
    }
    return true;
  }
  if (glfwKey == GLFW_KEY_ESCAPE && (saveAs_.open || render_.open)) {
    saveAs_.open = render_.open = false;
    return true;
  }
  if (glfwKey == GLFW_KEY_ENTER || glfwKey == GLFW_KEY_KP_ENTER) enterPressed_ = true;
  return dialogOpen();
}

void ViewerDocument::drawDialogs() {
  switch (drawUnsavedPrompt(prompt_)) {
    case DialogAnswer::Accept:
      prompt_.open = false;
      quitting_ = save();
      break;
    case DialogAnswer::Discard:
      prompt_.open = false;
      quitting_ = true;
      std::fprintf(stderr, "veltrane view: closed without saving the changes\n");
      break;
    case DialogAnswer::Cancel:
      prompt_.open = false;
      break;
    case DialogAnswer::None:
      break;
  }
  const bool enter = std::exchange(enterPressed_, false);
  DialogAnswer saveAs = drawSaveAs(saveAs_);
  if (enter && saveAs_.open) saveAs = DialogAnswer::Accept;
  if (saveAs == DialogAnswer::Accept) acceptSaveAs();
  if (saveAs == DialogAnswer::Cancel) saveAs_.open = false;
  DialogAnswer render = drawRenderDialog(render_);
  if (enter && render_.open) render = DialogAnswer::Accept;
  if (render == DialogAnswer::Accept) startRender();
  if (render == DialogAnswer::Cancel) render_.open = false;
}

void ViewerDocument::acceptSaveAs() {
  const std::string path = saveAs_.path.data();
  saveAs_.problem.clear();
  if (path.empty()) {
    saveAs_.problem = "type the path to save the scene to";
    return;
  }
  std::error_code error;
  const bool elsewhere = !fs::exists(savePath_, error) || !fs::equivalent(path, savePath_, error);
  if (!saveAs_.confirmingReplace && fs::is_regular_file(path, error) && elsewhere) {
    saveAs_.confirmingReplace = true;
    return;
  }
  saveAs_.confirmingReplace = false;
  if (!saveTo(path)) {
    saveAs_.problem = session_.status();
    return;
  }
  savePath_ = path;
  saveAs_.open = false;
}

void ViewerDocument::startRender() {
  const std::string output = render_.output.data();
  if (output.empty()) {
    render_.problem = "type the file to render to";
    return;
  }
  // The render reads a copy of the scene as it is now, so editing goes on while it runs.
  std::error_code ignored;
  if (!renderFolder_.empty()) fs::remove_all(renderFolder_, ignored);
  std::string folder = (fs::temp_directory_path(ignored) / "veltrane-view-XXXXXX").string();
  if (!mkdtemp(folder.data())) {
    render_.problem = "cannot make a temporary folder for the scene to render";
    return;
  }
  renderFolder_ = folder;
  const std::string copy = folder + "/scene.json";
  std::vector<std::string> arguments{copy,       "-o",        output,
                                     "--plugin", modulePath_, render_.replace ? "-y" : "-n"};
  if (render_.from[0]) arguments.insert(arguments.end(), {"--from", render_.from.data()});
  if (render_.to[0]) arguments.insert(arguments.end(), {"--to", render_.to.data()});
  if (render_.codec > 0)
    arguments.insert(arguments.end(),
                     {"--codec", renderCodecChoices()[static_cast<std::size_t>(render_.codec)]});
  try {
    session_.writeCopy(copy);
    running_ = std::make_unique<BackgroundRender>(arguments);
  } catch (const std::exception& error) {
    render_.problem = error.what();
    return;
  }
  renderOutput_ = output;
  render_.open = false;
}

bool ViewerDocument::pollRender() {
  if (!running_ || running_->poll()) return running_ != nullptr;
  // Its last line says what came of it: "wrote ...", or why it was refused or failed.
  session_.setStatus(running_->lastLine(), !running_->succeeded());
  running_.reset();
  return false;
}

RenderProgress ViewerDocument::renderProgress() const {
  RenderProgress progress;
  if (!running_) return progress;
  progress.running = true;
  progress.output = renderOutput_;
  progress.done = running_->done();
  progress.total = running_->total();
  return progress;
}

void ViewerDocument::stopRender() {
  if (running_) running_->stop();
}

}  // namespace veltrane_viewer
