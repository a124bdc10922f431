#pragma once

/// corvisa: a small VISA library for machines without a vendor VISA.
///
/// It opens TCP/IP resources and carries raw SCPI over the socket, so that
/// applications and tests can use VISA addresses anywhere:
///
/// - "TCPIP[board]::host::port::SOCKET" connects to host:port.
/// - "TCPIP[board]::host[::device]::INSTR" ("::inst0", "::hislip0", any
///   device name, or none) connects to port 5025 of host, or to the port in
///   the environment variable CORVISA_INSTR_PORT. There is no VXI-11 or
///   HiSLIP framing: an INSTR resource is a raw socket like a SOCKET one.
///
/// Resource names are compared without regard to case; the host is a
/// dotted IPv4 address or a name that resolves to one.
///
/// A raw socket has no END indicator. A read therefore treats a line feed
/// that ends a response message as END (VI_SUCCESS); a line feed inside the
/// data of a definite-length block ("#3100<100 bytes>") does not end it.
/// Writes send their bytes only; VI_ATTR_SEND_END_EN is kept but has no
/// form on the wire.
///
/// Every function is thread-safe. Handles are small numbers; a handle that
/// is not open gives VI_ERROR_INV_OBJECT. Bad input (null pointers, names of
/// any length) gives an error status, never a crash.

#include <stddef.h>

#ifdef __cplusplus
extern "C" {
#endif

#if defined(_WIN32)
#if defined(CORVISA_BUILDING)
#define CORVISA_API __declspec(dllexport)
#else
#define CORVISA_API __declspec(dllimport)
#endif
#else
/// Marks the functions libcorvisa exports; everything else is hidden.
#define CORVISA_API __attribute__((visibility("default")))
#endif

/* ---- Types, with their widths on x86-64 Linux -------------------------- */

typedef unsigned int ViUInt32;       /* 32 bits */
typedef signed int ViInt32;          /* 32 bits */
typedef unsigned short ViUInt16;     /* 16 bits */
typedef signed short ViInt16;        /* 16 bits */
typedef unsigned char ViUInt8;       /* 8 bits */
typedef unsigned long long ViUInt64; /* 64 bits */
typedef ViUInt16 ViBoolean;          /* VI_TRUE or VI_FALSE */
typedef char ViChar;
typedef unsigned char ViByte;
typedef ViInt32 ViStatus;      /* < 0 error, 0 success, > 0 success with a note */
typedef ViUInt32 ViObject;     /* any handle */
typedef ViObject ViSession;    /* a resource manager or a resource session */
typedef ViObject ViFindList;   /* the rest of a viFindRsrc result */
typedef ViUInt32 ViAttr;       /* attribute id */
typedef ViUInt64 ViAttrState;  /* attribute value: 64 bits on 64-bit platforms */
typedef ViUInt32 ViAccessMode; /* VI_NO_LOCK, ...; ignored here */
typedef ViSession *ViPSession;
typedef ViFindList *ViPFindList;
typedef ViUInt32 *ViPUInt32;
typedef ViChar *ViString;
typedef const ViChar *ViConstString;
typedef ViString ViRsrc;
typedef ViConstString ViConstRsrc;
typedef ViByte *ViBuf;
typedef ViByte *ViPBuf;
typedef const ViByte *ViConstBuf;

/* ---- Constants ----------------------------------------------------------- */

#define VI_NULL 0
#define VI_TRUE 1
#define VI_FALSE 0
/// The size of a description buffer, terminating zero included.
#define VI_FIND_BUFLEN 256
/// Time-outs in milliseconds: 0 does not wait, VI_TMO_INFINITE waits without limit.
#define VI_TMO_IMMEDIATE 0u
#define VI_TMO_INFINITE 0xFFFFFFFFu
#define VI_NO_LOCK 0u
#define VI_EXCLUSIVE_LOCK 1u
#define VI_SHARED_LOCK 2u
#define VI_LOAD_CONFIG 4u

/// Status codes: an error has bit 31 set. Written as sums so that every
/// value stays a plain int expression.
#define CORVISA_ERROR_BASE (-0x7FFFFFFF - 1)
#define VI_SUCCESS ((ViStatus)0)
#define VI_SUCCESS_TERM_CHAR ((ViStatus)0x3FFF0005)
#define VI_SUCCESS_MAX_CNT ((ViStatus)0x3FFF0006)
#define VI_ERROR_SYSTEM_ERROR ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF0000))
#define VI_ERROR_INV_OBJECT ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF000E))
#define VI_ERROR_RSRC_NFOUND ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF0011))
#define VI_ERROR_INV_RSRC_NAME ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF0012))
#define VI_ERROR_TMO ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF0015))
#define VI_ERROR_NSUP_ATTR ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF001D))
#define VI_ERROR_NSUP_ATTR_STATE ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF001E))
#define VI_ERROR_ALLOC ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF003C))
#define VI_ERROR_IO ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF003E))
#define VI_ERROR_INV_PARAMETER ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF0078))
#define VI_ERROR_CONN_LOST ((ViStatus)(CORVISA_ERROR_BASE + 0x3FFF00A6))

/// The attributes a session knows. viGetAttribute writes exactly the width
/// given here.
#define VI_ATTR_TMO_VALUE ((ViAttr)0x3FFF001Au)   /* ViUInt32, ms, default 2000 */
#define VI_ATTR_SEND_END_EN ((ViAttr)0x3FFF0016u) /* ViBoolean, default VI_TRUE */
#define VI_ATTR_TERMCHAR ((ViAttr)0x3FFF0018u)    /* ViUInt8, default 0x0A */
#define VI_ATTR_TERMCHAR_EN ((ViAttr)0x3FFF0038u) /* ViBoolean, default VI_FALSE */

/* ---- The VISA functions ---------------------------------------------------- */

/// Opens a resource manager and writes its handle to `vi`.
/// VI_ERROR_INV_PARAMETER when `vi` is null.
CORVISA_API ViStatus viOpenDefaultRM(ViPSession vi);

/// Opens the resource `name` through the resource manager `sesn` and writes
/// the session handle to `vi`. The connection must be made within `timeout`
/// ms (0 or VI_TMO_INFINITE: 5000 ms); `mode` is ignored.
/// Failures: VI_ERROR_INV_OBJECT (`sesn` is no resource manager),
/// VI_ERROR_INV_PARAMETER (`name` or `vi` null), VI_ERROR_INV_RSRC_NAME
/// (longer than 255 characters), VI_ERROR_RSRC_NFOUND (a form this library
/// does not open, a host that does not resolve, a refused or unreachable
/// connection, or a time-out while connecting).
/// Example: "tcpip0::127.0.0.1::5025::socket" -> VI_SUCCESS.
CORVISA_API ViStatus viOpen(ViSession sesn, ViConstRsrc name, ViAccessMode mode, ViUInt32 timeout, ViPSession vi);

/// Closes a session, a find list, or a resource manager together with every
/// session and find list opened through it. A read or write that is waiting
/// on a closed session ends with VI_ERROR_CONN_LOST.
CORVISA_API ViStatus viClose(ViObject vi);

/// Throws away the input of a session that has arrived and not been read,
/// without waiting for more.
CORVISA_API ViStatus viClear(ViSession vi);

/// Lists the resources named in the environment variable CORVISA_RESOURCES
/// (separated by ";") that match `expr`: "?" is any one character, "*" any
/// run of characters, case does not count ("?*INSTR", "TCPIP?*",
/// "?*::SOCKET"). Writes the first match to `desc` (at most VI_FIND_BUFLEN
/// bytes with the zero), the number of matches to `retCnt` and a find list
/// holding the rest to `vi`; `vi`, `retCnt` and `desc` may be null.
/// No match: VI_ERROR_RSRC_NFOUND, 0 in `retCnt` and VI_NULL in `vi`.
CORVISA_API ViStatus viFindRsrc(ViSession sesn, ViConstString expr, ViPFindList vi, ViPUInt32 retCnt, ViChar desc[]);

/// Writes the next match of a find list to `desc`; VI_ERROR_RSRC_NFOUND past
/// the last one.
CORVISA_API ViStatus viFindNext(ViFindList vi, ViChar desc[]);

/// Sets one of the VI_ATTR_ values above. VI_ERROR_NSUP_ATTR for another
/// attribute or a handle that is no session; VI_ERROR_NSUP_ATTR_STATE for a
/// value out of the attribute's range. The time-out applies to each
/// following read and write.
CORVISA_API ViStatus viSetAttribute(ViObject vi, ViAttr attrName, ViAttrState attrValue);

/// Writes the value of an attribute to `attrValue` in the attribute's own
/// width: 4 bytes for VI_ATTR_TMO_VALUE, 2 for the ViBoolean ones, 1 for
/// VI_ATTR_TERMCHAR. VI_ERROR_INV_PARAMETER when `attrValue` is null.
CORVISA_API ViStatus viGetAttribute(ViObject vi, ViAttr attrName, void *attrValue);

/// Reads at most `cnt` bytes into `buf` and writes their count to `retCnt`
/// (which may be null). Ends with
/// - VI_SUCCESS after the line feed that ends a message (see above),
/// - VI_SUCCESS_TERM_CHAR after VI_ATTR_TERMCHAR when VI_ATTR_TERMCHAR_EN is on,
/// - VI_SUCCESS_MAX_CNT when `cnt` bytes came first; the rest is kept for
///   the next read,
/// - VI_ERROR_TMO when VI_ATTR_TMO_VALUE ran out, with the bytes so far,
/// - VI_ERROR_CONN_LOST when the peer has closed the connection, with the
///   bytes that came before the close.
CORVISA_API ViStatus viRead(ViSession vi, ViPBuf buf, ViUInt32 cnt, ViPUInt32 retCnt);

/// Sends all `cnt` bytes of `buf` and writes the count sent to `retCnt`
/// (which may be null). VI_ERROR_TMO when the peer takes nothing for
/// VI_ATTR_TMO_VALUE, VI_ERROR_CONN_LOST when it has gone.
CORVISA_API ViStatus viWrite(ViSession vi, ViConstBuf buf, ViUInt32 cnt, ViPUInt32 retCnt);

/// Writes a text for `status` to `desc`, zero-terminated within
/// VI_FIND_BUFLEN bytes: "VI_ERROR_TMO: Timeout expired before operation
/// completed." For a code it does not know it writes "Unknown status
/// \x01\x7f\xc3\xa9 code" (bytes outside printable ASCII on purpose, so
/// that clients can test their filtering) and still answers VI_SUCCESS.
/// `vi` is not looked at.
CORVISA_API ViStatus viStatusDesc(ViObject vi, ViStatus status, ViChar desc[]);

/* ---- The call recorder ----------------------------------------------------- */

/// Switches the call recorder: 1 empties the record and starts recording,
/// 0 stops it (the record stays). Returns the previous state, 1 or 0.
/// While it records, every call of the functions above adds one line:
/// "viOpenDefaultRM", "viOpen <resource>", "viClose", "viClear",
/// "viFindRsrc <expr>", "viFindNext", "viSetAttribute 0x3FFF001A 500",
/// "viGetAttribute 0x3FFF001A", "viWrite <count>", "viRead <count>",
/// "viStatusDesc 0xBFFF0015" (hex with 8 upper-case digits).
CORVISA_API int corvisa_record(int on);

/// Copies the record, one line per call each ending in "\n", into `buffer`
/// of `size` bytes: the first `size` bytes when it does not fit, with a
/// terminating zero when it does. Returns the record's length without the
/// zero; a null `buffer` only returns it. The record is left as it is.
CORVISA_API int corvisa_record_take(char *buffer, int size);

#ifdef __cplusplus
}
#endif
