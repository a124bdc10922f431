#pragma once

// Model classes shared by the JSON tests: a filter with a list of texts (the
// document every reader of the format knows) and a bench with lists of
// lists for deep round trips.

#include "wavemill/models/BoolSetting.h"
#include "wavemill/models/DoubleSetting.h"
#include "wavemill/models/Int32Setting.h"
#include "wavemill/models/Int64Setting.h"
#include "wavemill/models/ModelBase.h"
#include "wavemill/models/ModelCollection.h"
#include "wavemill/models/StringSetting.h"
#include "wavemill/models/SubSetting.h"
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
};

struct Segment : ModelBase {
  WAVEMILL_MODEL(Segment)
  Segment() : ModelBase("JsonTests::Segment") {}
  std::shared_ptr<Int32Setting> samples = init(std::make_shared<Int32Setting>("Samples"));
  std::shared_ptr<Int64Setting> offset = init(std::make_shared<Int64Setting>("Offset"));
  std::shared_ptr<BoolSetting> enabled = init(std::make_shared<BoolSetting>("Enabled"));
  std::shared_ptr<StringSetting> label = init(std::make_shared<StringSetting>("Label"));
};
using Segments = ModelCollection<Segment>;

struct Track : ModelBase {
  WAVEMILL_MODEL(Track)
  Track() : ModelBase("JsonTests::Track") {}
  std::shared_ptr<StringSetting> name = init(std::make_shared<StringSetting>("Name"));
  std::shared_ptr<SubSetting<Segments>> segments = init(std::make_shared<SubSetting<Segments>>("Segments"));
};

struct Bench : ModelBase {
  WAVEMILL_MODEL(Bench)
  Bench() : ModelBase("JsonTests::Bench") {}
  std::shared_ptr<DoubleSetting> level = init(std::make_shared<DoubleSetting>("Level", -10.0, -130.0, 20.0, 0.0));
  std::shared_ptr<SubSetting<Filter>> filter = init(std::make_shared<SubSetting<Filter>>("Filter"));
  std::shared_ptr<SubSetting<ModelCollection<Track>>> tracks =
      init(std::make_shared<SubSetting<ModelCollection<Track>>>("Tracks"));
  // A list whose items are lists: only models are written as items, so it
  // is saved empty.
  std::shared_ptr<SubSetting<ModelCollection<Segments>>> lanes =
      init(std::make_shared<SubSetting<ModelCollection<Segments>>>("Lanes"));
};

// A filter at 1000 with the title "Low pass" and the texts "One" and "Two".
inline std::shared_ptr<Filter> makeFilter() {
  auto filter = std::make_shared<Filter>();
  filter->cutoff->setValue(1000);
  filter->title->setValue("Low pass");
  for (const char *text : {"One", "Two"}) {
    auto item = std::make_shared<TextModel>();
    item->Text->setValue(text);
    filter->texts->getValue()->add(item);
  }
  return filter;
}

// Three tracks of one, two and three segments, and a title with escapes that
// come back unchanged (a double quotation mark followed by a blank would not).
inline std::shared_ptr<Bench> makeBench() {
  auto bench = std::make_shared<Bench>();
  bench->level->setValue(-42.5);
  bench->filter->getValue()->title->setValue("Band\tpass\nlines \\ and 'marks'");
  auto tracks = bench->tracks->getValue();
  for (int t = 0; t < 3; ++t) {
    auto track = tracks->addItem();
    track->name->setValue("Track " + std::to_string(t));
    auto segments = track->segments->getValue();
    for (int s = 0; s <= t; ++s) {
      auto segment = segments->addItem();
      segment->samples->setValue(100 * t + s);
      segment->offset->setValue(-(std::int64_t(1) << 40) + s);
      segment->enabled->setValue(s % 2 == 0);
      segment->label->setValue("T" + std::to_string(t) + "S" + std::to_string(s));
    }
  }
  return bench;
}

} // namespace JsonTests
