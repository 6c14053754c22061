// Reuse of textures by key, oldest first, with a fence per texture given back so that uploads
// only ever get textures GL is done with.
#include "refhost/gl/texture_pool.h"

#include <GL/glew.h>

#include <algorithm>
#include <iterator>

namespace refhost {
namespace {

bool finished(GLsync fence) {
  if (!fence) return true;
  GLenum state = glClientWaitSync(fence, 0, 0);
  return state == GL_ALREADY_SIGNALED || state == GL_CONDITION_SATISFIED;
}

// The storage a texture of the key takes, near enough: 16 bytes a texel for 32-bit float
// formats, 8 for 16-bit ones, 4 for the rest.
std::size_t bytesOf(const TextureKey& key) {
  std::size_t texel = 4;
  switch (key.internalFormat) {
    case GL_RGBA32F:
      texel = 16;
      break;
    case GL_RGBA16F:
    case GL_RGBA16:
      texel = 8;
      break;
    default:
      break;
  }
  return static_cast<std::size_t>(std::max(key.width, 0)) *
         static_cast<std::size_t>(std::max(key.height, 0)) * texel;
}

void forget(GLuint id, GLsync fence) {
  if (fence) glDeleteSync(fence);
  glDeleteTextures(1, &id);
}

}  // namespace

TexturePool::~TexturePool() = default;

// An upload takes the oldest texture GL is done with. Drawing, which GL orders after earlier
// use by itself, takes the newest, so that those finished stay for the uploads.
uint32_t TexturePool::reuse(std::deque<Waiting>& waiting, bool forUpload) {
  if (waiting.empty()) return 0;
  auto chosen = std::prev(waiting.end());
  if (forUpload) {
    chosen = std::find_if(waiting.begin(), waiting.end(),
                          [](const Waiting& w) { return finished(static_cast<GLsync>(w.fence)); });
    if (chosen == waiting.end()) return 0;
  }
  if (chosen->fence) glDeleteSync(static_cast<GLsync>(chosen->fence));
  const uint32_t id = chosen->id;
  waiting.erase(chosen);
  return id;
}

uint32_t TexturePool::acquire(const TextureKey& key, bool forUpload) {
  auto found = waiting_.find(key);
  GLuint id = found == waiting_.end() ? 0 : reuse(found->second, forUpload);
  if (id != 0) waitingBytes_ -= bytesOf(key);
  GLint previous = 0;
  glGetIntegerv(GL_TEXTURE_BINDING_2D, &previous);
  if (id == 0) {
    glGenTextures(1, &id);
    glBindTexture(GL_TEXTURE_2D, id);
    glTexImage2D(GL_TEXTURE_2D, 0, static_cast<GLint>(key.internalFormat), key.width, key.height, 0,
                 key.pixelFormat, key.pixelType, nullptr);
    ++created_;
  } else {
    glBindTexture(GL_TEXTURE_2D, id);
  }
  // A texture comes back with whatever sampling its last user chose; every one leaves here as a
  // new one starts.
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_LINEAR);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_LINEAR);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE);
  glBindTexture(GL_TEXTURE_2D, static_cast<GLuint>(previous));
  handedOut_[id] = key;
  return id;
}

bool TexturePool::giveBack(uint32_t id) {
  auto found = handedOut_.find(id);
  if (found == handedOut_.end()) return false;
  const TextureKey key = found->second;
  const std::size_t bytes = bytesOf(key);
  std::deque<Waiting>& waiting = waiting_[key];
  handedOut_.erase(found);
  if (waiting.size() >= kKeptPerKey) {
    forget(waiting.front().id, static_cast<GLsync>(waiting.front().fence));
    waiting.pop_front();
    waitingBytes_ -= bytes;
  }
  if (waitingBytes_ + bytes > kKeptBytes) {
    forget(id, nullptr);
    return true;
  }
  waiting.push_back(Waiting{id, glFenceSync(GL_SYNC_GPU_COMMANDS_COMPLETE, 0)});
  waitingBytes_ += bytes;
  return true;
}

void TexturePool::clear() {
  for (auto& entry : waiting_) {
    for (const Waiting& texture : entry.second)
      forget(texture.id, static_cast<GLsync>(texture.fence));
  }
  waiting_.clear();
  handedOut_.clear();
  waitingBytes_ = 0;
}

std::size_t TexturePool::waiting() const {
  std::size_t count = 0;
  for (const auto& entry : waiting_) count += entry.second.size();
  return count;
}

}  // namespace refhost
