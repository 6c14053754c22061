// Textures kept for reuse, keyed by size and format, so that a steady render asks GL for no new
// storage per frame. Needs the owner's GL context current in every call.
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <map>
#include <tuple>

namespace refhost {

struct TextureKey {
  int32_t width = 0;
  int32_t height = 0;
  uint32_t internalFormat = 0;
  uint32_t pixelFormat = 0;
  uint32_t pixelType = 0;
  bool operator<(const TextureKey& other) const {
    return std::tie(width, height, internalFormat, pixelFormat, pixelType) <
           std::tie(other.width, other.height, other.internalFormat, other.pixelFormat,
                    other.pixelType);
  }
};

class TexturePool {
 public:
  // At most this many textures of one key wait for reuse; more given back are deleted. A
  // render with two frames in flight, each with a few inputs, needs about this many.
  static constexpr std::size_t kKeptPerKey = 8;
  // And the textures waiting hold at most this many bytes in all: at 4K in half floats
  // (66 MB a texture) eight of them would already be half a gigabyte.
  static constexpr std::size_t kKeptBytes = std::size_t{384} << 20;

  TexturePool() = default;
  ~TexturePool();  // deletes nothing: GL may be gone by then; call clear() while it is not
  TexturePool(const TexturePool&) = delete;
  TexturePool& operator=(const TexturePool&) = delete;

  // A texture of the key with linear filtering and clamp-to-edge wrapping, its contents
  // undefined. With `forUpload` it is one whose earlier use GL has finished, so that writing
  // into it from the CPU never waits for drawing still under way. The texture binding of the
  // active unit is kept.
  uint32_t acquire(const TextureKey& key, bool forUpload);
  // Keeps a texture acquire() made for reuse; false (and nothing done) for any other name.
  bool giveBack(uint32_t id);
  // Deletes every texture waiting for reuse and forgets those handed out, which their holders
  // delete; for when the context goes.
  void clear();

  std::size_t waiting() const;
  // Textures the pool had to create, over its whole life.
  std::size_t created() const { return created_; }

 private:
  struct Waiting {
    uint32_t id;
    void* fence;  // GLsync set when given back
  };
  uint32_t reuse(std::deque<Waiting>& waiting, bool forUpload);

  std::map<TextureKey, std::deque<Waiting>> waiting_;
  std::map<uint32_t, TextureKey> handedOut_;
  std::size_t waitingBytes_ = 0;
  std::size_t created_ = 0;
};

}  // namespace refhost
