// Replays an event script on a scene running in the plug-in, as a viewer would deliver the
// events, and gathers the outcome: parameter values, undo steps, cursors and every message's
// answer; optionally the frame with its overlay after each event.
#pragma once

#include <nlohmann/json.hpp>

#include "events/event_script.h"
#include "refhost/engine.h"
#include "refhost/pipeline/frame_output.h"

namespace veltrane_cli {

// Plays every event in order through the engine's viewer channel. After each one the host
// reports every parameter whose value changed with message 7, as it does after any edit, and
// asks the plug-in what its viewer shows (see refhost::Engine::viewerState). With `overlays`,
// the frame at the script's time is rendered and the overlay drawn over it (draw overlay), one
// picture per event. Returns {"params", "undoSteps", "redoSteps", "openUndoStep", "cursors",
// "selectedInputs", "hover", "popupMenus", "results"}, where results[i] lists {"message",
// "result"} for each message event i sent ({"message", "param", "result"} for message 7).
nlohmann::ordered_json replayEvents(refhost::Engine& engine, const EventScript& script,
                                    refhost::FrameSink* overlays);

}  // namespace veltrane_cli
