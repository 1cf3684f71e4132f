#include "screens/SecondLevelViewController.h"

#include <chrono>

#include "platform/Log.h"
#include "platform/MainQueue.h"

namespace {

using screens::Category;
using screens::DictionaryCategory;
using screens::ListCategory;
using screens::RecordDictionaryCategory;

constexpr std::string_view kComeBackLater = "Come back later";
constexpr auto kRefreshInterval = std::chrono::seconds(5);

// Text as itself; numbers and everything else in their plain text form.
std::string valueText(const platform::Value& value) {
  if (const std::string* text = value.asString()) return *text;
  return value.description();
}

}  // namespace

SecondLevelViewController::SecondLevelViewController(store::MetricValidator& validator)
    : myMetricValidator_(validator) {}

void SecondLevelViewController::viewDidLoad() {
  ui::TableViewController::viewDidLoad();
  refreshTimer_ = ui::Timer::scheduledTimer(
      kRefreshInterval, [this] { update(); }, true);
}

void SecondLevelViewController::update() {
  platform::postToMainQueue([table = weakTableView()] {
    if (const auto shown = table.lock()) shown->reloadData();
  });
}

std::size_t SecondLevelViewController::numberOfSections(ui::TableView&) {
  const Category* shown = category();
  const auto* list = shown != nullptr ? std::get_if<ListCategory>(shown) : nullptr;
  if (list == nullptr || list->firstOnly) return 1;
  return list->read(myMetricValidator_).size();
}

std::optional<std::string> SecondLevelViewController::titleForHeader(ui::TableView&,
                                                                     std::size_t section) {
  const Category* shown = category();
  const auto* list = shown != nullptr ? std::get_if<ListCategory>(shown) : nullptr;
  if (list == nullptr || !list->headerPrefix) return std::nullopt;
  return std::string(*list->headerPrefix) + std::to_string(section);
}

std::size_t SecondLevelViewController::numberOfRows(ui::TableView&, std::size_t section) {
  const Category* shown = category();
  if (shown == nullptr) return 1;
  if (const auto* dictionary = std::get_if<DictionaryCategory>(shown);
      dictionary != nullptr && !myMetricValidator_.displayDictionary(dictionary->dictionary)) {
    if (dictionary->dictionary == store::DisplayDictionary::LTESCellInfo)
      platform::log::plain("You are screwed");
    return 1;
  }
  const platform::Dictionary* rows = entries(*shown, section);
  return rows != nullptr ? rows->size() : 0;
}

std::shared_ptr<ui::TableViewCell> SecondLevelViewController::cellForRow(ui::TableView& tableView,
                                                                         ui::IndexPath indexPath) {
  auto cell = tableView.dequeueReusableCell("SecondClickView");
  ui::Label* text = cell->textLabel();
  ui::Label* detail = cell->detailTextLabel();

  const Category* shown = category();
  if (shown == nullptr) {
    if (text) text->text = std::string(kComeBackLater);
    if (detail) detail->text = std::string(kComeBackLater);
    return cell;
  }
  // Entries keep the order they were stored in; the store may have changed since the rows were
  // counted, so a row past the end shows nothing.
  const platform::Dictionary* rows = entries(*shown, indexPath.section);
  if (rows == nullptr || indexPath.row >= rows->size()) return cell;
  const auto& [key, value] = *(rows->begin() + static_cast<std::ptrdiff_t>(indexPath.row));
  if (text) text->text = key;
  if (detail) detail->text = valueText(value);
  return cell;
}

std::optional<std::string> SecondLevelViewController::categoryKey() const {
  if (!firstSelection_ || !seguedThroughRow_) return std::nullopt;
  return *firstSelection_ + " " + *seguedThroughRow_;
}

const Category* SecondLevelViewController::category() const {
  const std::optional<std::string> key = categoryKey();
  return key ? screens::categoryFor(*key) : nullptr;
}

const platform::Dictionary* SecondLevelViewController::entries(const Category& shown,
                                                               std::size_t section) const {
  if (const auto* dictionary = std::get_if<DictionaryCategory>(&shown)) {
    const auto& stored = myMetricValidator_.displayDictionary(dictionary->dictionary);
    return stored ? &*stored : nullptr;
  }
  if (const auto* record = std::get_if<RecordDictionaryCategory>(&shown))
    return &record->read(myMetricValidator_);
  const auto& list = std::get<ListCategory>(shown);
  const platform::List& elements = list.read(myMetricValidator_);
  const std::size_t element = list.firstOnly ? 0 : section;
  return element < elements.size() ? elements[element].asDictionary() : nullptr;
}
