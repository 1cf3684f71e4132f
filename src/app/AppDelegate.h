#pragma once

#include <memory>

#include "ui/Application.h"

// The application's delegate: it holds the window and otherwise leaves launching to the interface
// description and the root navigation controller.
class AppDelegate : public ui::ApplicationDelegate {
 public:
  std::shared_ptr<ui::Window> window() const override { return window_; }
  void setWindow(std::shared_ptr<ui::Window> window) override { window_ = std::move(window); }

  // Ignores the options and answers true.
  bool didFinishLaunchingWithOptions(
      const std::optional<platform::Dictionary>& launchOptions) override;

 private:
  std::shared_ptr<ui::Window> window_;
};
