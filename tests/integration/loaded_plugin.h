// Fixture: the real module loaded by the reference host, with the plug-in loaded, its
// parameters declared and one instance created.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "refhost/core/host.h"
#include "refhost/core/module.h"
#include "support/instrumented_host.h"

// Cut i through the frame-space point (x, y), its direction in degrees (0 along +y).
inline void setCut(testsupport::InstrumentedHost& host, int i, float x, float y, float degrees) {
  host.setValue("cutPosition_" + std::to_string(i), refhost::ParamValue::ofPoint(x, y));
  host.setValue("cutDirection_" + std::to_string(i), refhost::ParamValue::ofFloat(degrees));
}

class LoadedPlugin : public ::testing::Test {
 protected:
  void SetUp() override {
    host_ = std::make_unique<testsupport::InstrumentedHost>(module_);
    ASSERT_EQ(host_->send(kMessageLoad), 1);
    ASSERT_EQ(host_->send(kMessageDeclareParameters), 1);
    ASSERT_EQ(host_->send(kMessageCreateInstance), 1);
    host_->clearCallLog();
  }
  void TearDown() override {
    // Unknown ids, kind mismatches and stray releases are the plug-in misusing the host.
    for (const std::string& problem : host_->problems()) ADD_FAILURE() << "host: " << problem;
    if (host_->api().instanceData) host_->send(kMessageDestroyInstance);
    host_->send(kMessageUnload);
    host_.reset();
  }

  testsupport::InstrumentedHost& host() { return *host_; }

  // Sends a message whose event names a parameter.
  int32_t sendParamEvent(int32_t message, const char* id) {
    WispParamEvent event{id};
    host_->setEvent(&event);
    const int32_t result = host_->send(message);
    host_->setEvent(nullptr);
    return result;
  }

  refhost::Module module_{VELTRANE_MODULE_PATH};
  std::unique_ptr<testsupport::InstrumentedHost> host_;
};
