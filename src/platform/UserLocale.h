#pragma once

#include <string>

namespace Corvane::Wavemill::Platform {

enum class UserLocaleConversion {
  done,
  failed, // the text holds a sequence the user's character set does not know
  plain   // the user's locale is the plain "C"/"POSIX" one: nothing converted
};

// Conversions between narrow text in the character set of the user's locale
// (the one LC_ALL, LC_CTYPE or LANG names, as setlocale(LC_CTYPE, "") would
// choose it) and wide text. The locale is a private object of the call: the
// process's locale and the calling thread's stay as they were, so these are
// safe beside an application that has chosen a locale of its own, and
// beside each other on several threads. Each result ends at the input's
// first zero element.
UserLocaleConversion narrowToWideInUserLocale(const std::string &narrow, std::wstring &wide);
UserLocaleConversion wideToNarrowInUserLocale(const std::wstring &wide, std::string &narrow);

} // namespace Corvane::Wavemill::Platform
