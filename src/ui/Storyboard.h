#pragma once

#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "ui/IndexPath.h"
#include "ui/NavigationController.h"
#include "ui/TableViewCell.h"
#include "ui/ViewController.h"

namespace ui {

// The interface description of an app: its screens (scenes) with their prototype cells, the
// navigation stack they live in, and which row taps lead to which screen.
class Storyboard {
 public:
  using MakeScreen = std::function<std::unique_ptr<ViewController>()>;
  using MakeNavigation =
      std::function<std::unique_ptr<NavigationController>(std::unique_ptr<ViewController> root)>;

  struct Scene {
    std::string identifier;
    MakeScreen make;
    // The top bar's text; a screen reached by a row tap shows the row's text when it has none.
    std::optional<std::string> title;
    // Registered with the screen's table, if it has one.
    std::vector<TableViewCell> prototypes;
  };

  // A tap on any cell made from the prototype `cellIdentifier` pushes a new `destination` scene.
  struct Segue {
    std::string identifier;
    std::string cellIdentifier;
    std::string destination;
  };

  // The window's root is made by `navigation`, with a `rootScene` screen at the bottom.
  Storyboard(MakeNavigation navigation, std::string rootScene);

  void addScene(Scene scene);
  void addSegue(Segue segue);

  // The window's root: the navigation stack with the root scene on it.
  std::unique_ptr<NavigationController> instantiateInitialViewController() const;
  // A new screen of the scene. Throws std::out_of_range for an unknown scene.
  std::unique_ptr<ViewController> instantiateViewController(std::string_view scene) const;
  const std::string& rootScene() const { return rootScene_; }

  // Where a tap on a cell of this prototype leads, if anywhere.
  const Segue* segueFromCell(std::string_view cellIdentifier) const;

  // Taps the row at `indexPath` of the table shown on top of `navigation`: makes the screen the
  // row leads to, lets the current screen prepare it with the tapped cell as sender, and pushes
  // it. False, and nothing changes, when there is no such row or it leads nowhere.
  bool selectRow(NavigationController& navigation, IndexPath indexPath) const;

 private:
  MakeNavigation makeNavigation_;
  std::string rootScene_;
  std::map<std::string, Scene, std::less<>> scenes_;
  std::map<std::string, Segue, std::less<>> seguesByCell_;
};

}  // namespace ui
