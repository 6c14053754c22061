// The module driven through one reference host with a GL context: every message is checked
// for its expected answer, for textures and buffers the plug-in kept, and for GL errors.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <memory>
#include <set>
#include <string>

#include "refhost/core/host.h"
#include "refhost/core/module.h"

namespace veltrane_cli {

class PluginSession {
 public:
  // Loads the module and creates the host's GL context, or adopts `context` (a window's) when
  // given. Throws std::runtime_error naming the module or the GL step that failed.
  PluginSession(const std::string& modulePath, refhost::GlProfile profile,
                std::unique_ptr<refhost::GlContext> context = nullptr);
  // Destroys a live instance and unloads the plug-in (unchecked) when finish() was not reached.
  ~PluginSession();
  PluginSession(const PluginSession&) = delete;
  PluginSession& operator=(const PluginSession&) = delete;

  refhost::Host& host() { return *host_; }
  const std::string& modulePath() const { return module_.path(); }

  // Sends the message and checks afterwards that it answered one of `expected` (any answer
  // when empty), that no texture or buffer handed to the plug-in is outstanding and that GL
  // recorded no error. Throws std::runtime_error saying which message broke which rule. The
  // host's own complaints about the plug-in's calls are printed to stderr once each; its call
  // log holds the calls of this message only.
  int32_t send(int32_t message, std::initializer_list<int32_t> expected = {1});
  // The same with the message's context and event records, handed to the host for this message
  // only.
  int32_t send(int32_t message, void* context, void* event,
               std::initializer_list<int32_t> expected);

  // 0 (load) and 2 (declare the parameters).
  void load();
  // 3 (create an instance) and 8 (GL start-up).
  void createInstance();
  // 4 (destroy the instance) and 1 (unload).
  void finish();

 private:
  void reportHostProblems();

  refhost::Module module_;
  std::unique_ptr<refhost::Host> host_;
  bool loaded_ = false;
  bool instance_ = false;
  std::set<std::string> reportedProblems_;
};

}  // namespace veltrane_cli
