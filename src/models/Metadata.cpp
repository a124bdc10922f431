#include "wavemill/models/Metadata.h"

namespace Corvane::Wavemill {

Metadata::Metadata() : items(8) { items.max_load_factor(1.0f); }

void Metadata::setText(const std::string &key, std::string text) {
  set<std::string>(key, std::make_shared<std::string>(std::move(text)));
}

std::string Metadata::getText(const std::string &key) const {
  auto text = get<std::string>(key);
  return text ? *text : std::string();
}

} // namespace Corvane::Wavemill
