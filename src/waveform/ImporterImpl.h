#pragma once

#include "platform/WideFile.h"
#include "wavemill/waveform/DynamicBuffer.h"
#include "wavemill/waveform/Encryptor.h"
#include "wavemill/waveform/Importer2.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

struct Importer2::Impl {
  Corvane::Wavemill::Platform::WideFile iqFile;
  Corvane::Wavemill::Platform::WideFile markerFile;
  Corvane::Wavemill::Platform::WideFile residualIFile;
  Corvane::Wavemill::Platform::WideFile residualQFile;
  std::wstring wideFileName;
  bool streaming = false;

  // A null array is a package not seen (or freed); a package of length 0
  // still gets an array, so the two stay apart.
  std::unique_ptr<unsigned char[]> rawIq;
  int rawIqSize = 0;
  std::unique_ptr<unsigned char[]> rawMarkers;
  int rawMarkersSize = 0;
  std::unique_ptr<unsigned char[]> headerBody;
  std::unique_ptr<unsigned char[]> headerHead;
  std::unique_ptr<double[]> iValues;
  std::unique_ptr<double[]> qValues;

  bool dataValid = false;
  std::int64_t sampleCount = 0;
  int markerCount = 0;
  int headerBodyLen = 0;
  int residualWidth = 0;

  // Header values the format reserves; no operation reads them.
  unsigned int reservedMask = 0xFFFF0000u;
  int reservedWord = -1;
  double reservedValues[3] = {-1.0, -1.0, -1.0};
  int reservedTail = -1;

  Corvane::Wavemill::Decryptor decryptor;
  Corvane::Wavemill::DynamicBuffer assembly{1024};
  bool keyReady = false;
  unsigned int currentTag = 0;
  unsigned char staging[1024] = {};
  int stagingPos = 0;
  int stagingEnd = 0;
  std::int64_t packageLeft = 0;
  std::int64_t iqOffset = 0;
  std::int64_t markerOffset = 0;
  std::int64_t residualIOffset = 0;
  std::int64_t residualQOffset = 0;
  char errorText[4096] = {};
  unsigned int keyMask = 0;
  int formatFlag = 0;

  // streamingImporter2: samples not yet delivered, and the decrypted bytes
  // read beyond the last delivery. A read rounds up to whole blocks and
  // keeps less than one block, so 16 bytes hold any spill.
  std::int64_t iqLeft = 0;
  std::int64_t markersLeft = 0;
  int iqSpillCount = 0;
  int markerSpillCount = 0;
  unsigned char iqSpill[16] = {};
  unsigned char markerSpill[16] = {};
  std::vector<unsigned char> work;

  // Sets the message of "Error: Invalid Waveform data and waveform
  // information" and answers false when no header has been read.
  bool requireValid();
};
