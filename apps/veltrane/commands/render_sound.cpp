// Choosing the clips whose sound a video carries, by number, file, layer name or all of them.
#include "commands/render_sound.h"

#include <algorithm>
#include <filesystem>
#include <sstream>

#include "cli/cli_support.h"

namespace veltrane_cli {
namespace {

bool hasSound(const refhost::MediaSpec& media) {
  return media.kind == refhost::MediaSpec::Kind::File && media.info && media.info->hasAudio;
}

// Why a media has no sound, as the end of "clip N (NAME) ...".
std::string noSoundOf(const refhost::MediaSpec& media) {
  if (media.kind != refhost::MediaSpec::Kind::File) return "is generated, without sound";
  if (media.info && !media.info->video) return "is a still, without sound";
  return "has no sound";
}

int32_t clipNumber(const std::string& option, const std::string& text, std::size_t clips) {
  const int32_t number = text.find_first_not_of("0123456789") == std::string::npos && !text.empty()
                             ? parseInt32(option, text)
                             : 0;
  if (number < 1 || static_cast<std::size_t>(number) > clips)
    throw UsageError("option '" + option + "' expects a clip number from 1 to " +
                     std::to_string(clips) + ", got '" + text + "'");
  return number;
}

std::string checkedFile(const std::string& name) {
  std::error_code error;
  const auto status = std::filesystem::status(name, error);
  if (!std::filesystem::exists(status))
    throw UsageError("option '--audio-from': expected a file with sound, '" + name +
                     "' does not exist");
  if (std::filesystem::is_directory(status))
    throw UsageError("option '--audio-from': expected a file with sound, '" + name +
                     "' is a directory");
  return name;
}

// The clip numbers --audio and --audio-from name, each with sound.
std::vector<int32_t> chosenClips(const AudioFrom& from, const std::string* mode,
                                 const Scene& scene) {
  const std::vector<const refhost::MediaSpec*> media = sceneMedia(scene);
  const std::vector<std::string> names = clipNames(scene);
  std::vector<int32_t> numbers;
  if (from.kind == AudioFrom::Kind::Clip) {
    numbers.push_back(clipNumber("--audio-from", std::to_string(from.clip), media.size()));
  } else if (from.kind == AudioFrom::Kind::Layer) {
    for (std::size_t i = 0; i < scene.composition.layers.size() && numbers.empty(); ++i)
      if (scene.composition.layers[i].layer.name == from.name)
        numbers.push_back(static_cast<int32_t>(i) + 2);
    if (from.name == scene.composition.ownLayerName) numbers = {1};
    if (numbers.empty()) {
      std::string known = "'" + scene.composition.ownLayerName + "'";
      for (const refhost::CompositionLayer& layer : scene.composition.layers)
        known += ", '" + layer.layer.name + "'";
      throw UsageError(
          "option '--audio-from': expected 'layer' and the name of one of the scene's layers (" +
          known + "), got '" + from.name + "'");
    }
  } else if (mode && *mode == "mix") {
    for (std::size_t i = 0; i < media.size(); ++i)
      if (hasSound(*media[i])) numbers.push_back(static_cast<int32_t>(i) + 1);
    return numbers;
  } else if (mode) {
    std::stringstream list(*mode);
    for (std::string item; std::getline(list, item, ',');) {
      const int32_t number = clipNumber("--audio", item, media.size());
      if (std::find(numbers.begin(), numbers.end(), number) == numbers.end())
        numbers.push_back(number);
    }
    if (numbers.empty())
      throw UsageError("option '--audio' expects mix or clip numbers such as 1,3, got ''");
  }
  for (int32_t number : numbers) {
    const refhost::MediaSpec& chosen = *media[static_cast<std::size_t>(number) - 1];
    if (!hasSound(chosen))
      throw UsageError(std::string("option '") +
                       (from.kind != AudioFrom::Kind::None ? "--audio-from" : "--audio") + "': " +
                       names[static_cast<std::size_t>(number) - 1] + " " + noSoundOf(chosen));
  }
  return numbers;
}

}  // namespace

std::vector<const refhost::MediaSpec*> sceneMedia(const Scene& scene) {
  std::vector<const refhost::MediaSpec*> media{&scene.composition.source};
  for (const refhost::CompositionLayer& layer : scene.composition.layers)
    media.push_back(&layer.media);
  return media;
}

std::vector<std::string> clipNames(const Scene& scene) {
  std::vector<std::string> names;
  for (const refhost::MediaSpec* media : sceneMedia(scene)) {
    const std::string shown = media->kind == refhost::MediaSpec::Kind::File
                                  ? std::filesystem::path(media->path).filename().string()
                              : media->kind == refhost::MediaSpec::Kind::Pattern ? "a pattern"
                                                                                 : "a colour";
    names.push_back("clip " + std::to_string(names.size() + 1) + " (" + shown + ")");
  }
  return names;
}

AudioFrom takeAudioFrom(std::vector<std::string>& args) {
  AudioFrom found;
  const std::string option = "--audio-from";
  for (std::size_t i = 0; i < args.size();) {
    std::string value;
    if (args[i] == option) {
      if (i + 1 >= args.size()) throw UsageError("option '--audio-from' needs a value");
      value = args[i + 1];
      args.erase(args.begin() + static_cast<long>(i), args.begin() + static_cast<long>(i) + 2);
    } else if (args[i].rfind(option + "=", 0) == 0) {
      value = args[i].substr(option.size() + 1);
      args.erase(args.begin() + static_cast<long>(i));
    } else {
      ++i;
      continue;
    }
    if (!value.empty() && value.find_first_not_of("0123456789") == std::string::npos) {
      found = {AudioFrom::Kind::Clip, "", parseInt32(option, value)};
    } else if (value != "layer") {
      found = {AudioFrom::Kind::File, value, 0};
    } else if (i < args.size()) {
      found = {AudioFrom::Kind::Layer, args[i], 0};
      args.erase(args.begin() + static_cast<long>(i));
    } else {
      throw UsageError("option '--audio-from': expected a layer's name after 'layer'");
    }
  }
  return found;
}

SoundChoice chooseSound(const AudioFrom& from, const std::map<std::string, std::string>& options,
                        const Scene& scene, const std::string& pictureOutput, double startSeconds,
                        double seconds) {
  const std::string* mode = options.count("--audio") ? &options.at("--audio") : nullptr;
  const bool silent = options.count("--no-audio") > 0;
  const char* asked = from.kind != AudioFrom::Kind::None ? "--audio-from" : mode ? "--audio" : "";
  if (*asked && silent) throw UsageError(std::string("give ") + asked + " or --no-audio, not both");
  if (from.kind != AudioFrom::Kind::None && mode)
    throw UsageError("give --audio-from or --audio, not both");
  if (!pictureOutput.empty()) {
    if (*asked)
      throw UsageError(std::string("option '") + asked + "': " + pictureOutput +
                       " has no sound; it applies to .mp4, .mov, .mkv and .webm outputs");
    return {};
  }
  if (silent) return {{}, "--no-audio"};
  auto clip = [&](const std::string& path, bool required) {
    return refhost::AudioClip{path, startSeconds, seconds, required};
  };
  if (from.kind == AudioFrom::Kind::File) return {{clip(checkedFile(from.name), true)}, ""};
  const std::vector<const refhost::MediaSpec*> media = sceneMedia(scene);
  SoundChoice choice;
  if (*asked) {
    for (int32_t number : chosenClips(from, mode, scene))
      choice.clips.push_back(clip(media[static_cast<std::size_t>(number) - 1]->path, true));
    if (choice.clips.empty()) choice.silence = "no clip has sound";
    return choice;
  }
  if (hasSound(*media.front())) return {{clip(media.front()->path, false)}, ""};
  const bool others = std::any_of(media.begin() + 1, media.end(),
                                  [](const refhost::MediaSpec* m) { return hasSound(*m); });
  choice.silence = clipNames(scene).front() + " " + noSoundOf(*media.front()) +
                   (others ? "; --audio-from N or --audio mix takes the sound of other clips"
                           : ", and no other clip has sound");
  return choice;
}

}  // namespace veltrane_cli
