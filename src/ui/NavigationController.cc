#include "ui/NavigationController.h"

#include <stdexcept>
#include <utility>

namespace ui {

NavigationController::NavigationController(std::unique_ptr<ViewController> root) {
  if (!root) throw std::invalid_argument("a navigation stack needs a root screen");
  root->navigationController_ = this;
  stack_.push_back(std::move(root));
}

void NavigationController::pushViewController(std::unique_ptr<ViewController> controller) {
  if (!controller) throw std::invalid_argument("cannot push no screen");
  controller->navigationController_ = this;
  stack_.push_back(std::move(controller));
  if (isViewLoaded()) stack_.back()->appear();
}

bool NavigationController::popViewController() {
  if (stack_.size() == 1) return false;
  stack_.pop_back();
  if (isViewLoaded()) stack_.back()->appear();
  return true;
}

std::vector<ViewController*> NavigationController::viewControllers() const {
  std::vector<ViewController*> controllers;
  controllers.reserve(stack_.size());
  for (const auto& controller : stack_)
    controllers.push_back(controller.get());
  return controllers;
}

void NavigationController::viewWillAppear() {
  stack_.back()->appear();
}

}  // namespace ui
