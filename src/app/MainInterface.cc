#include "app/MainInterface.h"

#include "app/RootNavigationController.h"
#include "screens/FirstLevelViewController.h"
#include "screens/NorvoViewController.h"
#include "screens/SecondLevelViewController.h"
#include "screens/ThirdLevelViewController.h"

namespace {

template <class Screen>
ui::Storyboard::MakeScreen reading(store::MetricValidator* validator) {
  return [validator]() -> std::unique_ptr<ui::ViewController> {
    if (validator != nullptr) return std::make_unique<Screen>(*validator);
    return std::make_unique<Screen>();
  };
}

}  // namespace

ui::Storyboard mainInterface(store::MetricValidator* validator) {
  using ui::CellAccessory;
  using ui::CellStyle;
  using ui::TableViewCell;

  ui::Storyboard board(
      [](std::unique_ptr<ui::ViewController> root) {
        return std::make_unique<RootNavigationController>(std::move(root));
      },
      "Launch");

  board.addScene(
      {"Launch",
       [] { return std::make_unique<NorvoViewController>(); },
       "Norvo",
       {TableViewCell("LaunchView", CellStyle::Basic, CellAccessory::DisclosureIndicator)}});
  board.addScene(
      {"FirstLevel",
       reading<FirstLevelViewController>(validator),
       std::nullopt,
       {TableViewCell("FirstClickView", CellStyle::Basic, CellAccessory::DisclosureIndicator)}});
  board.addScene({"SecondLevel",
                  reading<SecondLevelViewController>(validator),
                  std::nullopt,
                  {TableViewCell("SecondClickView", CellStyle::RightDetail)}});

  TableViewCell nothingMore("ThirdClickView", CellStyle::Basic);
  nothingMore.textLabel()->text = "No further details";
  board.addScene({"ThirdLevel",
                  [] { return std::make_unique<ThirdLevelViewController>(); },
                  std::nullopt,
                  {nothingMore}});

  board.addSegue({"ShowFirstLevel", "LaunchView", "FirstLevel"});
  board.addSegue({"ShowSecondLevel", "FirstClickView", "SecondLevel"});
  // Detail rows carry no disclosure indicator, so the browser offers no link; the screen is
  // still reachable by its address.
  board.addSegue({"ShowThirdLevel", "SecondClickView", "ThirdLevel"});
  return board;
}
