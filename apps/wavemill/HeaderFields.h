#pragma once

#include "wavemill/waveform/exportimport/WaveformHeader.h"

#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace Corvane::Wavemill::Cli {

/// One field of a waveform header record, by the name `wv info` prints and
/// `wv pack --set` takes: the member's own name ("tag5", "block9Value",
/// "hasTextBlocks").
struct HeaderField {
  using Header = ExportImport::WaveformHeader;
  using Member = std::variant<unsigned int Header::*, unsigned short Header::*, unsigned char Header::*, char Header::*,
                              float Header::*, double Header::*, std::string Header::*, bool Header::*>;

  const char *name;
  Member member;
};

/// Every field in the order it is serialized, then the four flags.
const std::vector<HeaderField> &headerFields();

/// The field called `name`, or null.
const HeaderField *findHeaderField(std::string_view name);

/// The value as text: numbers locale-independent and shortest ("9e+99"),
/// bytes as numbers 0 to 255, flags "true"/"false". With `json`, texts are
/// JSON strings with their quotes and a number that is no finite value is
/// null; otherwise texts stand bare.
std::string formatField(const ExportImport::WaveformHeader &header, const HeaderField &field, bool json);

/// Sets the field from text: numbers as formatField writes them (integers
/// also as "0x..."), within the range of the field's type; flags as
/// true/false/1/0; texts as they stand. False, with the record unchanged,
/// for a value that does not fit.
bool setField(ExportImport::WaveformHeader &header, const HeaderField &field, std::string_view text);

/// What a value of the field looks like, for messages: "an integer from 0
/// to 65535", "a number", "true or false", "a text".
std::string describeField(const HeaderField &field);

} // namespace Corvane::Wavemill::Cli
