#pragma once

#include "wavemill/Export.h"

#include <gsl/span>

#include <complex>
#include <cstdint>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace Corvane::Wavemill {

class OperationSystem;

/// The shared tools of the product family: static functions only, no state.
/// Text functions work on std::string as a sequence of bytes; none looks at
/// an encoding except the wide conversions. Functions that parse answer with
/// a default and functions that look for something answer with false, an
/// empty text or -1, unless a function says otherwise. File and path
/// functions use "/" inside; "\" in an input is turned into "/" first.
/// Numbers are read and written in one form whatever locale the process has
/// set: a decimal point, no grouping ("2.5", never "2,5"). All functions are
/// reentrant; the wide conversions set the process's LC_CTYPE to the user's
/// locale (numbers do not depend on it).
class WAVEMILL_API Tools {
public:
  Tools() = delete;

  // ---- Text ---------------------------------------------------------------

  /// `s` without leading and trailing members of the set `chars`; an empty
  /// `s` or `chars` gives a copy of `s`.
  static std::string trim(const std::string &s, const std::string &chars);
  static std::string trim(const std::string &s, char c);
  /// `s` without leading members of the set `chars`.
  static std::string trimStart(const std::string &s, const std::string &chars);
  static std::string trimStart(const std::string &s, char c);
  /// `s` without trailing members of the set `chars`.
  static std::string trimEnd(const std::string &s, const std::string &chars);
  static std::string trimEnd(const std::string &s, char c);

  /// The pieces of `s` between members of the set `delimiters`. A delimiter
  /// at the very end adds no empty piece; one at the start or two in a row
  /// do: "a,b," -> {"a", "b"}, ",a" -> {"", "a"}, "" -> {""}, "," -> {""}.
  static std::vector<std::string> split(const std::string &s, const std::string &delimiters);
  static std::vector<std::string> split(const std::string &s, char delimiter);
  /// split, then each piece trimmed of the set `trimChars`.
  static std::vector<std::string> splitTrim(const std::string &s, const std::string &delimiters,
                                            const std::string &trimChars);
  static std::vector<std::string> splitTrim(const std::string &s, char delimiter, char trimChar);

  /// Every occurrence of `from` replaced by `to`, left to right, without
  /// overlap; text brought in by `to` is not searched again.
  static std::string replace(const std::string &s, std::string from, std::string to);
  /// The parts with `separator` between them.
  static std::string join(gsl::span<const std::string> parts, const std::string &separator);
  /// Appends `count` bytes of `data` to `target`.
  static void append(std::string &target, const char *data, int count);
  /// Equal lengths and equal bytes through toupper.
  static bool compareIgnoreCase(const std::string &a, const std::string &b);
  /// A copy with toupper applied to each byte.
  static std::string toUpper(const std::string &s);
  /// `s` between two double quotes; nothing is escaped.
  static std::string q(const std::string &s);
  /// `s` without a quote (" or ') at both ends; the two need not be alike.
  static std::string removeQuot(const std::string &s);
  /// The characters of `s` that occur in `allowed`, in their order: a filter.
  static std::string formatString(const std::string &s, const std::string &allowed);
  /// Exactly `length` characters: zeros at the left of a short `s`, the
  /// right-hand end of a long one. The largest length throws
  /// std::invalid_argument("length"). `s` is not changed.
  static std::string padLeftClip(std::string &s, std::uint64_t length);

  // ---- Bit strings --------------------------------------------------------

  /// The "0" and "1" among the first `length` characters of `s`, filled
  /// with "0" at the right to `length` characters.
  static std::string formatBitsWithLength(const std::string &s, int length);
  /// The low min(length, 32) bits of `value`, most significant first:
  /// (5, 4) -> "0101".
  static std::string uint32ToOneZeroString(std::uint32_t value, int length);
  /// One character a byte: 0 -> "0", 1 -> "1", other bytes are skipped.
  static std::string bitsToOneZeroString(gsl::span<const unsigned char> bits);
  /// One byte a character; a character other than "0" and "1" throws
  /// std::invalid_argument("input").
  static std::vector<unsigned char> oneZeroStringToBits(const std::string &s);

  // ---- Enumerations as text -----------------------------------------------

  /// The item at `index` of a comma-separated list (its first word); an
  /// index of 0 or less gives the first item, one past the end the last.
  static std::string enumIndexToText(const std::string &list, int index);
  /// The index of `text` as an item of `list`, or -1.
  static int textToEnumIndex(const std::string &list, const std::string &text);

  // ---- Numbers from text --------------------------------------------------

  /// The leading base-10 number of `s`, or `defaultValue`; never throws.
  /// " 2.5V" -> 2.5 also under a locale with a decimal comma.
  static int parseInt32(const std::string &s, int defaultValue);
  static std::int64_t parseInt64(const std::string &s, std::int64_t defaultValue);
  static double parseDouble(const std::string &s, double defaultValue);
  static float parseFloat(const std::string &s, float defaultValue);
  /// The leading number of `s` in `base`; false with `value` unchanged when
  /// there is none or it is out of range. Never throws.
  static bool tryParse(const std::string &s, int &value, int base);
  /// False for text the number filter refuses; otherwise the whole text read
  /// as std::stod reads it in the "C" locale, whose std::invalid_argument or
  /// std::out_of_range pass through (a lone sign or dot, an exponent of 999).
  static bool tryParse(const std::string &s, double &value);

  // ---- Numbers ------------------------------------------------------------

  /// `value` limited to [low, high].
  static float clip(float value, float low, float high);
  /// Inside the range, the nearest multiple of `step` counted from zero,
  /// kept in the range; outside the range, the bound. (7, 0, 10, 4) -> 8.
  static double clip(double value, double low, double high, double step);
  /// Clamped, then rounded up to the grid that starts at `low`, one step
  /// back when above `high`. (6, 1, 10, 4) -> 9.
  static int clip(int value, int low, int high, int step);
  /// Clamped, then rounded to a multiple of `step` (halves away from zero),
  /// one step back when above `high`. (9.9, 0, 10, 4) -> 8.
  static double round(double value, double low, double high, double step);
  /// `value` as a float without infinities or denormals.
  static float toSingle(double value);

  // ---- Wide text ----------------------------------------------------------

  /// Narrow to wide in the user's locale (UTF-8 where none applies); sets
  /// the process's LC_CTYPE to that locale, a change that stays in force.
  /// Malformed text gives "".
  static std::wstring toWString(const std::string &s);
  static std::wstring toWString(const char *data, int count);
  /// Wide to narrow in the user's locale.
  static std::string toString(const std::wstring &s);
  static std::string toString(const wchar_t *data, int count);

  // ---- Files --------------------------------------------------------------

  /// The platform the library was built for, made at first use.
  static OperationSystem &os();
  /// True when the file opens for reading.
  static bool exist(const std::string &path);
  /// The size of the file in bytes, -1 when it does not open.
  static std::int64_t fileSize(const std::string &path);
  /// The process's working directory.
  static std::string getCurrentDirectory();
  /// The temporary folder without trailing separators.
  static std::string getTempPath();
  /// The value of the environment variable, empty when unset.
  static std::string getenv(const std::string &name);
  /// The files of one folder, not recursive.
  static std::vector<std::string> getFiles(const std::string &directory);
  /// The folders of one folder.
  static std::vector<std::string> getSubDirectories(const std::string &directory);
  /// The first file of the tree below `directory` whose path ends in
  /// `fileName` (ignoring case; "\" counts as "/"), searching each folder's
  /// files before its subfolders; empty when none.
  static std::string findFile(const std::string &directory, const std::string &fileName);

  // ---- Configuration files ------------------------------------------------

  /// Key-value lines split at the first member of `delimiters`; keys and
  /// values trimmed, values also of quotes. A missing file gives an empty map.
  static std::map<std::string, std::string> readConfig(const std::string &path, const std::string &delimiters);
  /// One element per line of a small XML subset, keyed by the element path
  /// joined with "." (root.child.leaf). A missing file gives an empty map.
  static std::map<std::string, std::string> readXml(const std::string &path);
  /// Each line of the file; an unreadable file gives none.
  static std::vector<std::string> readLines(const std::string &path);
  /// The whole file as text; empty when unreadable.
  static std::string readText(const std::string &path);
  /// The whole file as bytes; an empty buffer when unreadable.
  static std::shared_ptr<std::vector<unsigned char>> readFile(const std::string &path);
  /// Creates or truncates the file and writes `text`; nothing on failure.
  static void writeText(const std::string &path, const std::string &text);
  /// Creates or truncates the file and writes `data`; nothing on failure.
  static void writeFile(const std::string &path, const std::vector<unsigned char> &data);
  /// Opens `stream` for binary writing; with `size` above 0 the file has its
  /// full size at once.
  static void openWrite(std::ofstream &stream, const std::string &path, std::int64_t size);

  // ---- Processes and network ----------------------------------------------

  static int getCurrentProcessId();
  /// The calling thread's id as a number.
  static std::uint64_t getCurrentThreadId();
  /// The ids of all processes.
  static std::vector<int> enumProcesses();
  /// True while the process runs; false for one that ended or never existed.
  static bool isRunning(int pid);
  /// Ends the process; false when it cannot be reached. `timeoutInMS` is
  /// not used.
  static bool killProcess(int pid, int timeoutInMS);
  /// Starts `commandLine` and waits up to `timeoutInMS` (negative: without
  /// limit) for its end. 0 once the program started, whatever its exit code
  /// and also when it outlasts the wait; the error code of a failed start
  /// otherwise. The first word names the program, found through PATH when it
  /// holds no "/"; the line is split into words by the quoting rules of a
  /// POSIX shell, but nothing is expanded and no shell runs:
  /// "tool 'a b' \"c\"" -> tool with "a b" and "c". On Linux the errors are
  /// errno values: ENOENT (no such program), EACCES (not executable), EINVAL
  /// (no word at all, or a quote left open).
  static int startProcess(const std::string &commandLine, int timeoutInMS);
  /// The parent of `pid` (negative: this process), or 0 when not found.
  static int getParentProcessId(int pid);
  /// The full path of the process image (negative pid: this process).
  static std::string getProcessPath(int pid);
  /// The host name; empty on failure.
  static std::string getHostname();
  /// True when `host` answers an ICMP echo within `timeoutInMS`.
  static bool ping(const std::string &host, int timeoutInMS);

  // ---- Modules ------------------------------------------------------------

  /// The path of the module that holds `address`, or of this library for
  /// null; empty on failure.
  static std::string getExecutingFileName(void *address = nullptr);
  /// The stem of getExecutingFileName, without "lib" at its start on Linux
  /// and Apple: "wavemill" for this library.
  static std::string getLibraryName(void *address = nullptr);
  /// The path of a loaded module; empty when it is not loaded.
  static std::string getModuleFileName(const std::string &moduleName);

  // ---- Waveform numbers ---------------------------------------------------
  // Samples are complex I/Q values; the byte form is big-endian signed
  // 16-bit I then Q, four bytes a sample.

  /// A file name shortened to the 23 characters an instrument accepts.
  static std::string getShortWaveformName(std::string name);
  /// Negates Q of every sample in place; a length that is not a multiple of
  /// 4 throws std::invalid_argument.
  static void mirrorSpectrum(gsl::span<unsigned char> waveform);
  /// The numbers in `text` split by `delimiters`, after dropping every
  /// character that cannot belong to a number. Empty text throws
  /// std::invalid_argument("input").
  static std::vector<double> parseDoubleArray(const std::string &text, const std::string &delimiters);
  /// The largest absolute I or Q value; 0 for no samples.
  static double calculatePeak(gsl::span<const std::complex<double>> samples);
  static double calculatePeak(const std::shared_ptr<std::vector<std::complex<double>>> &samples);
  /// sqrt(sum(I*I + Q*Q) / count); 0 becomes 1, no samples give NaN.
  static double calculateRms(gsl::span<const std::complex<double>> samples);
  static double calculateRms(const std::shared_ptr<std::vector<std::complex<double>>> &samples);
  /// Writes scale * 32767 * I and Q of each sample as big-endian 16-bit
  /// integers; `bytes` holds four bytes a sample.
  static void convertToWaveform(gsl::span<const std::complex<double>> samples, gsl::span<unsigned char> bytes,
                                double scale);
  /// A new buffer of the samples scaled by `scale / peak`.
  static std::shared_ptr<std::vector<unsigned char>> getWaveformBytes(gsl::span<const std::complex<double>> samples,
                                                                      double scale);
  static std::shared_ptr<std::vector<unsigned char>>
  getWaveformBytes(const std::shared_ptr<std::vector<std::complex<double>>> &samples, double scale);
  /// Sets `markerBit` in every marker byte, then clears it over each run of
  /// five or more samples below `threshold` that a higher sample ends.
  static void buildMarkers(gsl::span<const std::complex<double>> samples, gsl::span<unsigned char> markers,
                           int markerBit, double threshold);
  /// Sets bit `bit` of `count` bytes from `start` (negative count: to the
  /// end) to the lowest bit of `value`.
  static void setBits(gsl::span<unsigned char> bytes, int bit, int start, int count, int value);
  /// The start and end indices of the runs of `bit` in a file of marker
  /// bytes, over at most `length` bytes; empty when the file does not open.
  static std::vector<std::int64_t> getPulse(const std::string &path, std::int64_t length, int bit);
};

} // namespace Corvane::Wavemill
