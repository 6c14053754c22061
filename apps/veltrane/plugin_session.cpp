// Message sending with the checks every subcommand relies on.
#include "plugin_session.h"

#include <cstdio>
#include <stdexcept>

namespace veltrane_cli {
namespace {

std::string expectedText(std::initializer_list<int32_t> expected) {
  std::string text;
  for (int32_t value : expected) text += (text.empty() ? "" : " or ") + std::to_string(value);
  return text;
}

}  // namespace

PluginSession::PluginSession(const std::string& modulePath, refhost::GlProfile profile,
                             std::unique_ptr<refhost::GlContext> context)
    : module_(modulePath), host_(std::make_unique<refhost::Host>(module_)) {
  if (context)
    host_->attachGl(std::move(context));
  else
    host_->attachGl(profile);
}

PluginSession::~PluginSession() {
  try {
    if (instance_) host_->send(4);
    if (loaded_) host_->send(1);
  } catch (...) {
    // Already on a failure path; the first error is the one worth reporting.
  }
  host_.reset();
}

int32_t PluginSession::send(int32_t message, std::initializer_list<int32_t> expected) {
  refhost::GlContext* gl = host_->gl();
  if (gl) gl->clearErrors();
  // The log then holds this message's calls only: what a caller may inspect, and never more
  // than one message's worth over a long render.
  host_->clearCallLog();
  int32_t result = host_->send(message);
  reportHostProblems();
  // Nothing here reads the host's message history or frame requests; over a long render they
  // would grow by every message.
  host_->clearMessageHistory();
  host_->clearFrameRequests();
  std::string what = "message " + std::to_string(message);
  bool accepted = expected.size() == 0;
  for (int32_t value : expected) accepted = accepted || value == result;
  if (!accepted)
    throw std::runtime_error(what + " answered " + std::to_string(result) + ", expected " +
                             expectedText(expected));
  if (host_->outstandingTextures() > 0 || host_->outstandingBuffers() > 0)
    throw std::runtime_error(what + " left " + std::to_string(host_->outstandingTextures()) +
                             " texture(s) and " + std::to_string(host_->outstandingBuffers()) +
                             " buffer(s) with the plug-in that it did not give back");
  if (gl && !gl->errors().empty())
    throw std::runtime_error(what + " caused " + std::to_string(gl->errors().size()) +
                             " GL error(s), the first: " + gl->errors().front().text);
  return result;
}

int32_t PluginSession::send(int32_t message, void* context, void* event,
                            std::initializer_list<int32_t> expected) {
  host_->setRenderContext(context);
  host_->setEvent(event);
  int32_t result = 0;
  try {
    result = send(message, expected);
  } catch (...) {
    host_->setRenderContext(nullptr);
    host_->setEvent(nullptr);
    throw;
  }
  host_->setRenderContext(nullptr);
  host_->setEvent(nullptr);
  return result;
}

void PluginSession::reportHostProblems() {
  for (const std::string& problem : host_->problems()) {
    if (reportedProblems_.insert(problem).second)
      std::fprintf(stderr, "veltrane: host: %s\n", problem.c_str());
  }
  host_->clearProblems();
}

void PluginSession::load() {
  send(0);
  loaded_ = true;
  send(2);
}

void PluginSession::createInstance() {
  send(3);
  instance_ = true;
  send(8);
}

void PluginSession::finish() {
  if (instance_) {
    instance_ = false;
    send(4);
  }
  if (loaded_) {
    loaded_ = false;
    send(1);
  }
}

}  // namespace veltrane_cli
