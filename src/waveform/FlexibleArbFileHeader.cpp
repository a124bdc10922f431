#include "wavemill/waveform/FlexibleArbFileHeader.h"

#include <initializer_list>
#include <iterator>
#include <new>

namespace {

using Place = FileHeader::FieldPlace;

// Length 0 registers a variable field, running to the end of its block.
const Place Block1Layout[] = {
    {FileHeader::Tag5, 32}, {FileHeader::Tag6, 8},  {FileHeader::Tag7, 1},  {FileHeader::Tag8, 1},
    {FileHeader::Tag9, 1},  {FileHeader::Tag10, 1}, {FileHeader::Tag11, 1}, {FileHeader::Tag12, 1},
    {FileHeader::Tag13, 1}, {FileHeader::Tag15, 8}, {FileHeader::Tag16, 8}, {FileHeader::Tag17, 4},
    {FileHeader::Tag22, 2}, {FileHeader::Tag25, 8}, {FileHeader::Tag26, 1}, {FileHeader::Tag27, 4},
    {FileHeader::Tag28, 8}, {FileHeader::Tag29, 8}, {FileHeader::Tag30, 8}, {FileHeader::Tag31, 2},
    {FileHeader::Tag32, 1}, {FileHeader::Tag33, 8}, {FileHeader::Tag34, 1},
};
const Place Block2Layout[] = {{FileHeader::Tag39, 0}};
const Place Block3Layout[] = {
    {FileHeader::Tag20, 4}, {FileHeader::Tag35, 1}, {FileHeader::Tag36, 8},
    {FileHeader::Tag37, 8}, {FileHeader::Tag38, 4},
};
const Place Block10Layout[] = {
    {FileHeader::Tag41, 1}, {FileHeader::Tag42, 4}, {FileHeader::Tag43, 1}, {FileHeader::Tag44, 0}};
const Place Block11Layout[] = {{FileHeader::Tag45, 0}};
const Place Block12Layout[] = {{FileHeader::Tag46, 0}};

} // namespace

FlexibleArbFileHeader::FlexibleArbFileHeader() : FileHeader(true) { doInit(); }

FlexibleArbFileHeader::FlexibleArbFileHeader(const FileHeader &other) : FileHeader(other, true) {
  doInit();
  clear();
  convert(other);
}

FlexibleArbFileHeader::~FlexibleArbFileHeader() = default;

FileHeader *FlexibleArbFileHeader::build() {
  try {
    return new (std::nothrow) FlexibleArbFileHeader();
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

FileHeader *FlexibleArbFileHeader::copy(const FileHeader &other) {
  try {
    return new (std::nothrow) FlexibleArbFileHeader(other);
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

unsigned int FlexibleArbFileHeader::getHeaderId() const { return 0xFFFF0001u; }

void FlexibleArbFileHeader::doInit() {
  registerBlock(Block1, Block1Layout, static_cast<int>(std::size(Block1Layout)));
  registerBlock(Block2, Block2Layout, static_cast<int>(std::size(Block2Layout)));
  registerBlock(Block3, Block3Layout, static_cast<int>(std::size(Block3Layout)));
  registerBlock(Block10, Block10Layout, static_cast<int>(std::size(Block10Layout)));
  registerBlock(Block11, Block11Layout, static_cast<int>(std::size(Block11Layout)));
  registerBlock(Block12, Block12Layout, static_cast<int>(std::size(Block12Layout)));
}

void FlexibleArbFileHeader::clearHeader() {
  FileHeader::clearHeader();
  const auto put = [this](Tag tag, std::initializer_list<unsigned char> bytes) {
    writeBuffer(tag, reinterpret_cast<const char *>(bytes.begin()), static_cast<int>(bytes.size()));
  };
  const char zeros[32] = {};
  writeBuffer(Tag5, zeros, 32);
  for (Tag tag : {Tag6, Tag15, Tag16, Tag28, Tag29, Tag30, Tag33, Tag36, Tag37}) {
    writeValue<double>(tag, -1.0);
  }
  for (Tag tag : {Tag7, Tag8, Tag9, Tag10, Tag11, Tag12, Tag13, Tag26, Tag32, Tag34, Tag35, Tag41}) {
    put(tag, {0xFF});
  }
  for (Tag tag : {Tag17, Tag20, Tag42}) {
    put(tag, {0xBF, 0x80, 0x00, 0x00}); // float -1.0
  }
  put(Tag22, {0xFF, 0x00});
  writeValue<double>(Tag25, 9e99);
  for (Tag tag : {Tag27, Tag38}) {
    put(tag, {0x7C, 0xF0, 0xBD, 0xC2}); // a float of about 1e37
  }
  put(Tag31, {0xFF, 0xFF});
  // A four-byte word whose first byte, 00, is all the one-byte field takes.
  put(Tag43, {0x00, 0x00, 0x00, 0xFF});
  writeBuffer(Tag44, zeros, 0);
}

bool FlexibleArbFileHeader::verifyHeader() { return headerIdMatches(); }
