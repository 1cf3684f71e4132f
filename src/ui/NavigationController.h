#pragma once

#include <memory>
#include <vector>

#include "ui/ViewController.h"

namespace ui {

// A stack of screens: the bottom one is the root, the top one is shown.
class NavigationController : public ViewController {
 public:
  // Throws std::invalid_argument when `root` is null.
  explicit NavigationController(std::unique_ptr<ViewController> root);

  // Puts `controller` on top; if the stack is being shown, so is the new screen.
  void pushViewController(std::unique_ptr<ViewController> controller);
  // Takes the top screen off and destroys it; the root stays. False when only the root is left.
  bool popViewController();

  ViewController& topViewController() const { return *stack_.back(); }
  // Bottom first.
  std::vector<ViewController*> viewControllers() const;

 protected:
  void viewWillAppear() override;

 private:
  std::vector<std::unique_ptr<ViewController>> stack_;
};

}  // namespace ui
