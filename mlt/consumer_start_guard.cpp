// Guarding the avformat consumer's start against its own thread.
//
// MLT 7.12's avformat consumer starts by storing its thread's handle in the property "thread",
// creating the thread, and only then setting "running" to 1; the thread opens the output and
// encodes while "running" is 1. When the starting thread is held up for a millisecond or two
// after creating the new one (a busy machine: two melt jobs on two cores are enough), the new
// thread finds "running" still 0, writes no frame, closes the output and marks the consumer
// stopped (running 0). If that comes before the starter's running = 1, melt ends at once with
// status 0 and an empty output; if after, "running" stays 1 with no thread left to end it, and
// melt waits for ever. Every melt job can meet it, with or without this module's services.
//
// The guard, on each avformat consumer the factory makes:
//  - when the start stores "thread" (just before it creates the thread), sets running = 1
//    already, so that the thread finds the consumer running;
//  - should the thread end even before the starter's own running = 1 (an output that cannot be
//    opened, a job over in that instant), lets the thread's running = 0 wait for it and then
//    puts 0 back, so that the consumer reads as stopped and melt ends.
#include "consumer_start_guard.h"

#include <framework/mlt.h>

#include <chrono>
#include <condition_variable>
#include <cstring>
#include <mutex>
#include <thread>

namespace veltrane_mlt {
namespace {

const char* const kGuardProperty = "_veltrane_start_guard";

// How long an ending thread waits for its starter's running = 1. The starter sets it right
// after creating the thread; the bound only keeps the thread from waiting for ever should a
// later avformat consumer start differently.
constexpr std::chrono::seconds kLongestStartWait(10);

struct StartGuard {
  std::mutex mutex;
  std::condition_variable started;
  bool starting = false;  // from "thread" stored to the starter's running = 1
  std::thread::id starter;
};

void onThreadStored(mlt_properties properties, StartGuard& guard) {
  // The stop clears "thread"; a consumer already running when it stores it needs nothing.
  if (!mlt_properties_get_data(properties, "thread", nullptr) ||
      mlt_properties_get_int(properties, "running"))
    return;
  mlt_properties_set_int(properties, "running", 1);
  std::lock_guard<std::mutex> lock(guard.mutex);
  guard.starting = true;
  guard.starter = std::this_thread::get_id();
}

void onRunningChanged(mlt_properties properties, StartGuard& guard) {
  std::unique_lock<std::mutex> lock(guard.mutex);
  if (!guard.starting) return;
  if (std::this_thread::get_id() == guard.starter) {
    guard.starting = false;
    guard.started.notify_all();
    return;
  }
  // The consumer's thread ending before its starter has said it runs.
  guard.started.wait_for(lock, kLongestStartWait, [&] { return !guard.starting; });
  guard.starting = false;
  lock.unlock();
  mlt_properties_set_int(properties, "running", 0);
}

void onPropertyChanged(mlt_properties properties, void* guard, mlt_event_data event) {
  const char* name = mlt_event_data_to_string(event);
  if (!name) return;
  if (std::strcmp(name, "thread") == 0)
    onThreadStored(properties, *static_cast<StartGuard*>(guard));
  else if (std::strcmp(name, "running") == 0)
    onRunningChanged(properties, *static_cast<StartGuard*>(guard));
}

void onConsumerMade(mlt_properties, void*, mlt_event_data event) {
  auto* made = static_cast<mlt_factory_event_data*>(mlt_event_data_to_object(event));
  if (!made || !made->name || std::strcmp(made->name, "avformat") != 0 || !made->service) return;
  // The factory hands the address of its variable that holds the service (through the same
  // field, a listener to a request can supply one).
  auto consumer = *static_cast<mlt_consumer*>(made->service);
  if (!consumer) return;
  mlt_properties properties = MLT_CONSUMER_PROPERTIES(consumer);
  auto* guard = new StartGuard;
  mlt_properties_set_data(
      properties, kGuardProperty, guard, 0,
      [](void* data) { delete static_cast<StartGuard*>(data); }, nullptr);
  mlt_events_listen(properties, guard, "property-changed", onPropertyChanged);
}

}  // namespace

void guardEncoderStarts() {
  mlt_events_listen(mlt_factory_event_object(), nullptr, "consumer-create-done", onConsumerMade);
}

}  // namespace veltrane_mlt
