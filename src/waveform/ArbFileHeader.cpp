#include "wavemill/waveform/ArbFileHeader.h"

#include <initializer_list>
#include <new>

namespace {

const FileHeader::FieldPlace ArbLayout[] = {
    {FileHeader::Tag5, 32}, {FileHeader::Tag6, 8},  {FileHeader::Tag7, 1},  {FileHeader::Tag8, 1},
    {FileHeader::Tag9, 1},  {FileHeader::Tag10, 1}, {FileHeader::Tag11, 1}, {FileHeader::Tag12, 1},
    {FileHeader::Tag13, 1}, {FileHeader::Tag14, 1}, {FileHeader::Tag15, 8}, {FileHeader::Tag16, 8},
    {FileHeader::Tag17, 4}, {FileHeader::Tag18, 4}, {FileHeader::Tag19, 4}, {FileHeader::Tag20, 4},
    {FileHeader::Tag21, 2}, {FileHeader::Tag22, 2}, {FileHeader::Tag23, 2}, {FileHeader::Tag24, 2},
};

// Where the fixed layout starts: behind the 16 bytes of the base block.
constexpr int FirstOffset = 16;

} // namespace

ArbFileHeader::ArbFileHeader() : FileHeader(false) { doInit(); }

ArbFileHeader::ArbFileHeader(const FileHeader &other) : FileHeader(other, false) {
  doInit();
  clear();
  convert(other);
}

ArbFileHeader::~ArbFileHeader() = default;

FileHeader *ArbFileHeader::build() {
  try {
    return new (std::nothrow) ArbFileHeader();
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

FileHeader *ArbFileHeader::copy(const FileHeader &other) {
  try {
    return new (std::nothrow) ArbFileHeader(other);
  } catch (const std::bad_alloc &) {
    return nullptr;
  }
}

unsigned int ArbFileHeader::getHeaderId() const { return 0; }

void ArbFileHeader::doInit() {
  int offset = FirstOffset;
  for (const FieldPlace &place : ArbLayout) {
    registerLocation(place.tag, Location{offset, place.length, BlockBase});
    offset += place.length;
  }
}

void ArbFileHeader::clearHeader() {
  FileHeader::clearHeader();
  const auto put = [this](Tag tag, std::initializer_list<unsigned char> bytes) {
    writeBuffer(tag, reinterpret_cast<const char *>(bytes.begin()), static_cast<int>(bytes.size()));
  };
  const char zeros[32] = {};
  writeBuffer(Tag5, zeros, 32);
  writeValue<double>(Tag6, -1.0);
  for (int tag = Tag7; tag <= Tag14; ++tag) {
    put(static_cast<Tag>(tag), {0xFF});
  }
  writeValue<double>(Tag15, -1.0);
  writeValue<double>(Tag16, -1.0);
  for (int tag = Tag17; tag <= Tag20; ++tag) {
    put(static_cast<Tag>(tag), {0xBF, 0x80, 0x00, 0x00}); // float -1.0
  }
  put(Tag21, {0xFF, 0xFF});
  put(Tag22, {0xFF, 0x00});
  put(Tag23, {0xFF, 0xFF});
  put(Tag24, {0x00, 0x00});
}

bool ArbFileHeader::verifyHeader() { return headerIdMatches(); }
