#pragma once

#include <optional>
#include <string>

namespace ui {

class NavigationController;
class StoryboardSegue;
class TableViewCell;

// One screen. Its view loads the first time it is shown; the navigation stack that holds it
// owns it, and it is destroyed when it leaves the stack.
class ViewController {
 public:
  virtual ~ViewController() = default;
  ViewController(const ViewController&) = delete;
  ViewController& operator=(const ViewController&) = delete;

  // What the top bar shows while the screen is on top.
  const std::optional<std::string>& title() const { return title_; }
  void setTitle(std::optional<std::string> title) { title_ = std::move(title); }

  // Runs viewDidLoad the first time only.
  void loadViewIfNeeded();
  bool isViewLoaded() const { return viewLoaded_; }

  // The stack the screen is on, or null.
  NavigationController* navigationController() const { return navigationController_; }

  // Called on the current screen after a tap on `sender` has made the screen that is about to be
  // pushed, `segue.destinationViewController()`. Does nothing unless a screen overrides it.
  virtual void prepareForSegue(StoryboardSegue& segue, const TableViewCell* sender);

 protected:
  ViewController() = default;

  virtual void viewDidLoad() {}
  // Each time the screen becomes the one shown, after its view has loaded.
  virtual void viewWillAppear() {}

 private:
  friend class NavigationController;
  friend class Window;

  // Loads the view if needed, then tells the screen that it is about to be shown.
  void appear();

  std::optional<std::string> title_;
  NavigationController* navigationController_ = nullptr;
  bool viewLoaded_ = false;
};

}  // namespace ui
