#include "ui/ViewController.h"

namespace ui {

void ViewController::loadViewIfNeeded() {
  if (viewLoaded_) return;
  viewLoaded_ = true;
  viewDidLoad();
}

void ViewController::prepareForSegue(StoryboardSegue&, const TableViewCell*) {}

void ViewController::appear() {
  loadViewIfNeeded();
  viewWillAppear();
}

}  // namespace ui
