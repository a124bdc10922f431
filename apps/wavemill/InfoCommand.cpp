#include "Commands.h"
#include "HeaderFields.h"
#include "Text.h"
#include "ToolError.h"
#include "WaveformReader.h"

#include "wavemill/waveform/exportimport/WaveformHeader.h"
#include "wavemill/waveform/exportimport/WaveformImporter.h"

#include <algorithm>
#include <iostream>
#include <string>
#include <utility>
#include <variant>
#include <vector>

namespace Corvane::Wavemill::Cli {

int runInfo(const InfoOptions &options) {
  // The reader checks the file and tells the sample format and whether
  // markers follow; the header record and the count are the importer's.
  WaveformReader wave(options.file);
  ExportImport::WaveformImporter importer(options.file);
  const auto record = importer.getWaveformHeader();
  if (record == nullptr)
    throw ToolError(options.file + " is not a waveform file");
  const ExportImport::WaveformHeader &header = *record;
  const auto bytes = importer.getHeaderBytes();
  const std::int64_t samples = importer.getDataLength();

  // name, value as text, value as JSON
  std::vector<std::pair<std::string, std::pair<std::string, std::string>>> summary = {
      {"file", {options.file, jsonString(options.file)}},
      {"samples", {formatNumber(samples), formatNumber(samples)}},
      {"format", {wave.floatIq() ? "float" : "integer", wave.floatIq() ? "\"float\"" : "\"integer\""}},
      {"markers", {wave.hasMarkers() ? "present" : "absent", wave.hasMarkers() ? "true" : "false"}},
      {"headerLength", {formatNumber(static_cast<int>(bytes.size())), formatNumber(static_cast<int>(bytes.size()))}},
      {"fileSize", {formatNumber(wave.fileSize()), formatNumber(wave.fileSize())}},
  };

  std::string out;
  if (options.json) {
    out = "{\n";
    for (const auto &[name, value] : summary)
      out += "  " + jsonString(name) + ": " + value.second + ",\n";
    out += "  \"header\": {";
    const char *separator = "\n";
    for (const auto &field : headerFields()) {
      out += separator + std::string("    ") + jsonString(field.name) + ": " + formatField(header, field, true);
      separator = ",\n";
    }
    out += "\n  }\n}\n";
  } else {
    std::size_t width = 0;
    for (const auto &field : headerFields())
      width = std::max(width, std::string(field.name).size());
    for (const auto &[name, value] : summary)
      out += name + std::string(width + 2 - name.size(), ' ') + value.first + "\n";
    out += "\n";
    for (const auto &field : headerFields()) {
      const std::string name = field.name;
      // Texts are quoted so that their blanks show.
      const bool text = std::holds_alternative<std::string HeaderField::Header::*>(field.member);
      const std::string value = formatField(header, field, false);
      out += name + std::string(width + 2 - name.size(), ' ') + (text ? jsonString(value) : value) + "\n";
    }
  }
  std::cout << out << std::flush;
  return 0;
}

} // namespace Corvane::Wavemill::Cli
