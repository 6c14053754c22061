// Binding textures to texture units with the clamping and filtering every sampler of the effect
// expects. Units are named as glActiveTexture names them (GL_TEXTURE0, GL_TEXTURE1, ...).
#pragma once

#include <GL/glew.h>

namespace veltrane {

// Makes `unit` active, binds `texture` to `target`, clamps to edge and, if `linear`, filters
// linearly. Parameters go to GL_TEXTURE_2D, the only target the effect samples.
void bindTextureUnit(GLenum unit, GLenum target, GLuint texture, bool linear);

// Makes `unit` active, clamps its bound texture to edge and, if `nearest`, filters it nearest.
void setTextureUnitNearest(GLenum unit, GLenum target, bool nearest);

// As setTextureUnitNearest, then unbinds `target` on that unit.
void unbindTextureUnit(GLenum unit, GLenum target, bool nearest);

}  // namespace veltrane
