#include "ui/Storyboard.h"

#include <stdexcept>
#include <utility>

#include "ui/StoryboardSegue.h"
#include "ui/TableViewController.h"

namespace ui {

Storyboard::Storyboard(MakeNavigation navigation, std::string rootScene)
    : makeNavigation_(std::move(navigation)), rootScene_(std::move(rootScene)) {}

void Storyboard::addScene(Scene scene) {
  std::string identifier = scene.identifier;
  scenes_.insert_or_assign(std::move(identifier), std::move(scene));
}

void Storyboard::addSegue(Segue segue) {
  std::string cell = segue.cellIdentifier;
  seguesByCell_.insert_or_assign(std::move(cell), std::move(segue));
}

std::unique_ptr<NavigationController> Storyboard::instantiateInitialViewController() const {
  return makeNavigation_(instantiateViewController(rootScene_));
}

std::unique_ptr<ViewController> Storyboard::instantiateViewController(
    std::string_view scene) const {
  const auto found = scenes_.find(scene);
  if (found == scenes_.end())
    throw std::out_of_range("no scene is called \"" + std::string(scene) + "\"");
  std::unique_ptr<ViewController> controller = found->second.make();
  controller->setTitle(found->second.title);
  if (auto* table = dynamic_cast<TableViewController*>(controller.get()))
    for (const TableViewCell& prototype : found->second.prototypes)
      table->tableView().registerPrototype(prototype);
  return controller;
}

const Storyboard::Segue* Storyboard::segueFromCell(std::string_view cellIdentifier) const {
  const auto found = seguesByCell_.find(cellIdentifier);
  return found == seguesByCell_.end() ? nullptr : &found->second;
}

bool Storyboard::selectRow(NavigationController& navigation, IndexPath indexPath) const {
  ViewController& source = navigation.topViewController();
  auto* table = dynamic_cast<TableViewController*>(&source);
  if (table == nullptr) return false;
  const std::shared_ptr<TableViewCell> cell = table->tableView().cellForRow(indexPath);
  if (!cell) return false;
  const Segue* segue = segueFromCell(cell->reuseIdentifier());
  if (segue == nullptr) return false;

  std::unique_ptr<ViewController> destination = instantiateViewController(segue->destination);
  if (!destination->title()) destination->setTitle(cell->textLabel()->text);
  StoryboardSegue transition(segue->identifier, source, *destination);
  source.prepareForSegue(transition, cell.get());
  navigation.pushViewController(std::move(destination));
  return true;
}

}  // namespace ui
