#pragma once

#include <cstdint>

namespace Corvane::Wavemill::Visa {

// The VISA types with the widths of the C ABI on 64-bit Linux. They are
// declared here because no VISA header is part of the build: the library is
// found at run time and spoken to through these prototypes only.
using ViStatus = std::int32_t;
using ViUInt16 = std::uint16_t;
using ViUInt32 = std::uint32_t;
using ViUInt64 = std::uint64_t;
using ViObject = ViUInt32;
using ViSession = ViObject;
using ViFindList = ViObject;
using ViAttr = ViUInt32;
// A 64-bit platform passes attribute values in 64 bits; narrower attributes
// take the low bits.
using ViAttrState = ViUInt64;
using ViAccessMode = ViUInt32;
using ViBoolean = ViUInt16;
using ViChar = char;
using ViByte = unsigned char;

constexpr ViStatus viSuccess = 0;
constexpr ViStatus viSuccessMaxCount = 0x3FFF0006;
// What a missing entry of the table answers: the VISA layer "failed".
constexpr ViStatus viErrorSystemError = static_cast<ViStatus>(0xBFFF0000u);
constexpr ViStatus viErrorIo = static_cast<ViStatus>(0xBFFF003Eu);

constexpr ViAttr viAttrSendEndEnable = 0x3FFF0016;
constexpr ViAttr viAttrTimeoutValue = 0x3FFF001A;

// The size of every description buffer the VISA functions fill.
constexpr int viFindBufferLength = 256;

extern "C" {
using ViOpenDefaultRM = ViStatus (*)(ViSession *vi);
using ViOpen = ViStatus (*)(ViSession sesn, const ViChar *name, ViAccessMode mode, ViUInt32 timeout, ViSession *vi);
using ViClose = ViStatus (*)(ViObject vi);
using ViClear = ViStatus (*)(ViSession vi);
using ViFindRsrc = ViStatus (*)(ViSession sesn, const ViChar *expr, ViFindList *vi, ViUInt32 *retCnt, ViChar desc[]);
using ViFindNext = ViStatus (*)(ViFindList vi, ViChar desc[]);
using ViSetAttribute = ViStatus (*)(ViObject vi, ViAttr attrName, ViAttrState attrValue);
using ViGetAttribute = ViStatus (*)(ViObject vi, ViAttr attrName, void *attrValue);
using ViRead = ViStatus (*)(ViSession vi, ViByte *buf, ViUInt32 cnt, ViUInt32 *retCnt);
using ViWrite = ViStatus (*)(ViSession vi, const ViByte *buf, ViUInt32 cnt, ViUInt32 *retCnt);
using ViStatusDesc = ViStatus (*)(ViObject vi, ViStatus status, ViChar desc[]);
}

} // namespace Corvane::Wavemill::Visa

namespace Corvane::Wavemill {

// The eleven VISA functions the sessions use, looked up by these names when
// the library loads. An entry is null when the VISA library or the function
// is missing; no call is made through a null entry.
struct Visa32Functions {
  Visa::ViOpenDefaultRM viOpenDefaultRM = nullptr;
  Visa::ViOpen viOpen = nullptr;
  Visa::ViClose viClose = nullptr;
  Visa::ViClear viClear = nullptr;
  Visa::ViFindRsrc viFindRsrc = nullptr;
  Visa::ViFindNext viFindNext = nullptr;
  Visa::ViSetAttribute viSetAttribute = nullptr;
  Visa::ViGetAttribute viGetAttribute = nullptr;
  Visa::ViRead viRead = nullptr;
  Visa::ViWrite viWrite = nullptr;
  Visa::ViStatusDesc viStatusDesc = nullptr;
};

} // namespace Corvane::Wavemill
