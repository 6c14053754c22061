// Which clips' sound a video output carries (--audio-from, --audio, --no-audio), and in one
// line why an output is silent. Clips are numbered from 1 in the scene's order: the effect's
// own source, then the layers' media as the scene lists them (for `split`, the clips in the
// order given).
#pragma once

#include <map>
#include <string>
#include <vector>

#include "refhost/media/audio_input.h"
#include "scene/scene_document.h"

namespace veltrane_cli {

// What --audio-from named: a file, a clip's number, or a layer by name (two words,
// "layer NAME", so that a name needs no quoting of its own).
struct AudioFrom {
  enum class Kind { None, File, Clip, Layer };
  Kind kind = Kind::None;
  std::string name;  // the file or the layer
  int32_t clip = 0;  // from 1
};

// Takes "--audio-from FILE|N" and "--audio-from layer NAME" out of the arguments and keeps them
// for renderScene; call before parsing the rest. A value of digits alone is a clip's number
// (a file of that name is ./N).
AudioFrom takeAudioFrom(std::vector<std::string>& args);

// The sound of the frames from `startSeconds` for `seconds`.
struct SoundChoice {
  std::vector<refhost::AudioClip> clips;  // none: a silent output
  std::string silence;                    // why it is silent, for a note; empty when it is not
};

// The sound a video output carries over the frames' time, with the options (--audio MODE,
// --no-audio) and --audio-from. `pictureOutput` says what an output that holds pictures only
// is ("a .png output"), which refuses the sound options; it is empty for a video. Throws
// UsageError for a choice that names no clip with sound.
SoundChoice chooseSound(const AudioFrom& from, const std::map<std::string, std::string>& options,
                        const Scene& scene, const std::string& pictureOutput, double startSeconds,
                        double seconds);

// The scene's media in the order clip numbers count them, and their names as messages give
// them ("clip 2 (b.mp4)").
std::vector<const refhost::MediaSpec*> sceneMedia(const Scene& scene);
std::vector<std::string> clipNames(const Scene& scene);

}  // namespace veltrane_cli
