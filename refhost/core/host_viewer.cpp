// Undo brackets, viewer requests (redraw, cursor, popup menu) and frame requests.
#include "refhost/core/host.h"
#include "refhost/platform/text.h"

namespace refhost {

void Host::beginUndo(const char* stepName) {
  log([&] { return std::string("BeginUndo " + logText(stepName)); });
  undo_.begin(stepName ? stepName : "");
}

void Host::endUndo() {
  log([&] { return std::string("EndUndo"); });
  if (!undo_.end(panel_)) problem("EndUndo without BeginUndo");
}

void Host::redraw(int32_t reserved) {
  log([&] { return std::string("Redraw " + std::to_string(reserved)); });
  checkReserved("Redraw", reserved);
  ++redraws_;
}

void Host::setCursor(int32_t shape) {
  log([&] { return std::string("SetCursor " + std::to_string(shape)); });
  cursorShapes_.push_back(shape);
}

int32_t Host::showPopupMenu(const char* items) {
  log([&] { return std::string("ShowPopupMenu " + logText(items)); });
  popupMenus_.push_back(items ? items : "");
  if (popupChooser_) return popupChooser_(popupMenus_.back());
  if (popupAnswers_.empty()) return -1;  // the user dismissed the menu
  int32_t answer = popupAnswers_.front();
  popupAnswers_.pop_front();
  return answer;
}

void Host::requestFrames(const char* guid, int32_t count, const uint32_t* frames, bool ownSource) {
  FrameRequest request;
  request.layerGuid = ownSource || !guid ? "" : guid;
  if (count > 0 && !frames)
    problem((ownSource ? "RequestFrames " : "RequestLayerFrames " + logId(guid) + " ") +
            std::to_string(count) + ": null frame list");
  for (int32_t i = 0; frames && i < count; ++i) request.frames.push_back(frames[i]);
  log([&] {
    std::string line = ownSource ? "RequestFrames " : "RequestLayerFrames " + logId(guid) + " ";
    line += std::to_string(count);
    for (uint32_t frame : request.frames) line += " " + std::to_string(frame);
    return line;
  });
  frameRequests_.push_back(std::move(request));
}

}  // namespace refhost
