#pragma once

// The trees the JSON tests save and recall: a filter whose document is
// compared byte for byte, and a rack of the shared models with a list.

#include "support/TestModels.h"
#include "wavemill/models/TextModel.h"

#include <cstdint>
#include <memory>
#include <string>

namespace JsonTests {

using namespace Corvane::Wavemill;

struct Filter : ModelBase {
  WAVEMILL_MODEL(Filter)
  Filter() : ModelBase("JsonTests::Filter") {}
  std::shared_ptr<DoubleSetting> cutoff = init(std::make_shared<DoubleSetting>("Cutoff", 0.0, 0.0, 1e9, 0.0));
  std::shared_ptr<StringSetting> title = init(std::make_shared<StringSetting>("Title"));
  std::shared_ptr<SubSetting<ModelCollection<TextModel>>> texts =
      init(std::make_shared<SubSetting<ModelCollection<TextModel>>>("Texts"));
  // A list whose items are lists: only models are written as items, so it
  // is saved empty.
  std::shared_ptr<SubSetting<ModelCollection<Testing::Sources>>> lanes =
      init(std::make_shared<SubSetting<ModelCollection<Testing::Sources>>>("Lanes"));
};

// A filter at 1000 with the title "Low pass" and the texts "One" and "Two".
inline std::shared_ptr<Filter> makeFilter() {
  auto filter = std::make_shared<Filter>();
  filter->cutoff->setValue(1000);
  filter->title->setValue("Low pass");
  for (const char *text : {"One", "Two"})
    filter->texts->getValue()->addItem()->Text->setValue(text);
  return filter;
}

// A rack of three sources and a name with escapes that come back unchanged
// (a double quotation mark followed by a blank would not).
inline std::shared_ptr<Testing::Rack> makeRack() {
  auto rack = std::make_shared<Testing::Rack>();
  rack->name->setValue("Band\tpass\nlines \\ and 'marks'");
  rack->source->getValue()->level->setValue(-42.5);
  for (int i = 0; i < 3; ++i) {
    auto source = rack->sources->getValue()->addItem();
    source->count->setValue(10 * i + 1);
    source->offset->setValue(-(std::int64_t(1) << 40) + i);
    source->on->setValue(i % 2 == 0);
    source->label->setValue("S" + std::to_string(i));
  }
  return rack;
}

} // namespace JsonTests
