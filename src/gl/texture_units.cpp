// Texture unit state changes shared by every pass.
#include "gl/texture_units.h"

namespace veltrane {
namespace {

void clampToEdge() {
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_S, GL_CLAMP_TO_EDGE);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_WRAP_T, GL_CLAMP_TO_EDGE);
}

void setFilters(GLint filter) {
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, filter);
  glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, filter);
}

}  // namespace

void bindTextureUnit(GLenum unit, GLenum target, GLuint texture, bool linear) {
  glActiveTexture(unit);
  glBindTexture(target, texture);
  clampToEdge();
  if (linear) setFilters(GL_LINEAR);
}

void setTextureUnitNearest(GLenum unit, GLenum /*target*/, bool nearest) {
  glActiveTexture(unit);
  clampToEdge();
  if (nearest) setFilters(GL_NEAREST);
}

void unbindTextureUnit(GLenum unit, GLenum target, bool nearest) {
  setTextureUnitNearest(unit, target, nearest);
  glBindTexture(target, 0);
}

}  // namespace veltrane
