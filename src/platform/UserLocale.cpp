#include "platform/UserLocale.h"

#include <langinfo.h>
#include <locale.h>

#include <cstdlib>
#include <cstring>

namespace Corvane::Wavemill::Platform {

namespace {

constexpr std::size_t conversionFailed = static_cast<std::size_t>(-1);

// The user's LC_CTYPE, in force on this thread only while the object lives.
class UserCharacterType {
public:
  UserCharacterType() : locale(newlocale(LC_CTYPE_MASK, "", static_cast<locale_t>(nullptr))) {
    if (locale != nullptr)
      previous = uselocale(locale);
  }
  ~UserCharacterType() {
    if (locale != nullptr) {
      uselocale(previous);
      freelocale(locale);
    }
  }
  UserCharacterType(const UserCharacterType &) = delete;
  UserCharacterType &operator=(const UserCharacterType &) = delete;

  // A name the environment gives but the system lacks counts as plain too:
  // setlocale would have left the "C" locale in force.
  bool isPlain() const {
    return locale == nullptr || std::strcmp(nl_langinfo_l(CODESET, locale), "ANSI_X3.4-1968") == 0;
  }

private:
  locale_t locale;
  locale_t previous = nullptr;
};

} // namespace

UserLocaleConversion narrowToWideInUserLocale(const std::string &narrow, std::wstring &wide) {
  const UserCharacterType user;
  if (user.isPlain())
    return UserLocaleConversion::plain;
  // Each byte yields at most one wide character, so the input's length plus
  // the terminator always suffices.
  std::wstring buffer(narrow.size() + 1, L'\0');
  if (std::mbstowcs(&buffer[0], narrow.c_str(), buffer.size()) == conversionFailed)
    return UserLocaleConversion::failed;
  wide = buffer.c_str();
  return UserLocaleConversion::done;
}

UserLocaleConversion wideToNarrowInUserLocale(const std::wstring &wide, std::string &narrow) {
  const UserCharacterType user;
  if (user.isPlain())
    return UserLocaleConversion::plain;
  // One wide character can take several bytes in a multibyte locale; a
  // buffer of only the input's length would cut such a text short.
  const auto perCharacter = static_cast<std::size_t>(MB_CUR_MAX);
  std::string buffer(wide.size() * perCharacter + 1, '\0');
  if (std::wcstombs(&buffer[0], wide.c_str(), buffer.size()) == conversionFailed)
    return UserLocaleConversion::failed;
  narrow = buffer.c_str();
  return UserLocaleConversion::done;
}

} // namespace Corvane::Wavemill::Platform
