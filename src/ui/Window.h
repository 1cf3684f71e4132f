#pragma once

#include <memory>

#include "ui/ViewController.h"

namespace ui {

// What one display shows: a root screen, usually a navigation stack.
class Window {
 public:
  ViewController* rootViewController() const { return root_.get(); }
  // The window owns its root from then on.
  void setRootViewController(std::unique_ptr<ViewController> root);

  // Shows the root: its view loads, and so does the view of the screen it shows.
  void makeKeyAndVisible();
  bool isVisible() const { return visible_; }

 private:
  std::unique_ptr<ViewController> root_;
  bool visible_ = false;
};

}  // namespace ui
