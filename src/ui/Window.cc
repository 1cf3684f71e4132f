#include "ui/Window.h"

#include <utility>

namespace ui {

void Window::setRootViewController(std::unique_ptr<ViewController> root) {
  root_ = std::move(root);
  if (visible_ && root_) root_->appear();
}

void Window::makeKeyAndVisible() {
  visible_ = true;
  if (root_) root_->appear();
}

}  // namespace ui
