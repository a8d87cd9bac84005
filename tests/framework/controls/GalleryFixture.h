#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "framework/native/NativeDisplay.h"
#include "tests/framework/controls/Desktop.h"

namespace Tarsa::testing {

// A gallery window (of class Window, made with a log callback) on the
// display, with what a test does to it as a user would: the pointer moved
// to a window point and then clicks, drags or keys, by xdotool; keys alone;
// the value lines the window logged; screenshots.
template <class Window>
class GalleryFixture : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!Native::HasDisplay()) GTEST_SKIP() << "no display; these tests run under xvfb-run";
    desktop_ = std::make_unique<Desktop>();
    window_ = std::make_unique<Window>([this](const std::string& line) { log_.push_back(line); });
    window_->Show();
    desktop_->Pump(0.3);
    xid_ = std::to_string(window_->Native().SystemHandle());
    ASSERT_NE(xid_, "0");
  }

  void TearDown() override {
    window_.reset();
    desktop_.reset();
  }

  // No --sync: it waits for a move, and never sees one to where the pointer
  // already is; the server keeps the move and the rest in order.
  int At(std::int32_t x, std::int32_t y, std::vector<std::string> then) {
    std::vector<std::string> arguments = {"mousemove", "--window", xid_, std::to_string(x),
                                          std::to_string(y)};
    arguments.insert(arguments.end(), then.begin(), then.end());
    return desktop_->Xdo(arguments);
  }
  int Keys(std::vector<std::string> keys) {
    std::vector<std::string> arguments = {"key", "--delay", "40"};
    arguments.insert(arguments.end(), keys.begin(), keys.end());
    return desktop_->Xdo(arguments);
  }
  bool Logged(const std::string& line) const {
    return std::find(log_.begin(), log_.end(), line) != log_.end();
  }
  void Screenshot(const std::string& name) {
    window_->PaintNow();
    EXPECT_TRUE(window_->SaveImage(Desktop::Artefact(name)));
  }

  std::unique_ptr<Desktop> desktop_;
  std::unique_ptr<Window> window_;
  std::vector<std::string> log_;
  std::string xid_;
};

}  // namespace Tarsa::testing
