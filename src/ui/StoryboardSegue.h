#pragma once

#include <string>
#include <utility>

#include "ui/ViewController.h"

namespace ui {

// A transition that is about to push `destinationViewController()` over
// `sourceViewController()`.
class StoryboardSegue {
 public:
  StoryboardSegue(std::string identifier, ViewController& source, ViewController& destination)
      : identifier_(std::move(identifier)), source_(source), destination_(destination) {}

  const std::string& identifier() const { return identifier_; }
  ViewController& sourceViewController() const { return source_; }
  ViewController& destinationViewController() const { return destination_; }

 private:
  std::string identifier_;
  ViewController& source_;
  ViewController& destination_;
};

}  // namespace ui
