// The plug-in-wide registry of GLSL programs: compiles, links, names and looks up every program
// the effect and its on-screen controls use, and sets uniforms of the current program.
#pragma once

#include <GL/glew.h>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "common/glsl_exception.h"  // what the build and link operations throw

namespace veltrane {

// One GL program. `linked` and `log` describe the last link.
struct ProgramRecord {
  GLuint id = 0;
  bool linked = false;
  std::string log;
};

// A registry name and the index of its program.
struct ProgramName {
  std::string name;
  int32_t index = -1;
};

// Lives from plug-in load to unload; owns every GL program it built and deletes them when it is
// destroyed (with the host's GL context current). Indices never change once given.
class EffectData {
 public:
  EffectData() = default;
  EffectData(const EffectData&) = delete;
  EffectData& operator=(const EffectData&) = delete;

  // The virtual operations keep this order; the destructor comes last.

  // Compiles the stages (geometry only when `geometry` is not empty), appends the program and
  // indexes `name`. Does not link. A compile failure throws and leaves the registry unchanged.
  virtual void createProgramWithGeometry(const std::string& vertex, const std::string& geometry,
                                         const std::string& fragment, bool verbose,
                                         const std::string& name);
  virtual void createProgram(const std::string& vertex, const std::string& fragment, bool verbose,
                             const std::string& name);
  // Links the named program; false when no program has that name.
  virtual bool linkProgram(const std::string& name, bool verbose);
  // Links the program at `index`: true, or a link exception. False for an index out of range.
  virtual bool linkProgramAt(int32_t index, bool verbose);
  // Create, bind the attribute locations, link. Attribute names are the shared identifiers when
  // `useSourceNames` is true, else the conventional in_* names. Each returns 1.
  virtual int addGeometryProgram(const std::string& vertex, const std::string& geometry,
                                 const std::string& fragment, bool verbose, const std::string& name,
                                 bool useSourceNames);
  virtual int addProgram(const std::string& vertex, const std::string& fragment, bool verbose,
                         const std::string& name, bool useSourceNames, bool withTexCoord);
  virtual int addDualTexCoordProgram(const std::string& vertex, const std::string& fragment,
                                     bool verbose, const std::string& name, bool useSourceNames);
  // May throw: the unload message turns a failed destruction into its own result.
  virtual ~EffectData() noexcept(false);

  void bindAttribute(const std::string& name, GLuint location, const std::string& attributeName);
  // GL id of the named program, or -1.
  int32_t programId(const std::string& name) const;
  // Registry index of the named program, or -1. Among equal names the last added wins, so a
  // second GL start-up rebinds and relinks the programs it has just added.
  int32_t programIndex(const std::string& name) const;
  // Index of the first program whose id is GL's current program, or -1.
  int32_t currentProgramIndex() const;
  void useProgram(const std::string& name) const;
  void useProgramAt(int32_t index) const;
  void releaseProgram() const;
  // Location in the current program, or in program 0 when the current one is not registered.
  GLint uniformLocation(const std::string& name) const;

  void setUniform1i(GLint location, GLint v) const;
  void setUniform4i(GLint location, GLint a, GLint b, GLint c, GLint d) const;
  void setUniform1f(GLint location, GLfloat x) const;
  void setUniform2f(GLint location, GLfloat x, GLfloat y) const;
  void setUniform3f(GLint location, GLfloat x, GLfloat y, GLfloat z) const;
  void setUniform4f(GLint location, GLfloat x, GLfloat y, GLfloat z, GLfloat w) const;
  // Dimension 2, 3 or 4 sets a square matrix array; any other dimension sets nothing.
  void setUniformMatrix(GLint location, int dimension, GLsizei count, bool transpose,
                        const GLfloat* data) const;

  int32_t programCount() const { return programCount_; }
  const ProgramRecord& program(int32_t index) const { return *programs_[index]; }
  const std::vector<ProgramName>& programNames() const { return programNames_; }

 private:
  void bindAttributeAt(int32_t index, GLuint location, const char* attributeName);

  std::vector<std::unique_ptr<ProgramRecord>> programs_;
  int32_t programCount_ = 0;
  std::vector<ProgramName> programNames_;  // sorted by name, byte-wise
};

}  // namespace veltrane
