#include "DecimalPointGuard.h"

#include <clocale>
#if defined(__has_include)
#if __has_include(<langinfo.h>)
#include <langinfo.h>
#define ZON_HAS_LANGINFO 1
#endif
#endif

namespace {

char ProcessDecimalPoint()
{
    // nl_langinfo may be called from several threads at once; localeconv
    // fills a shared static structure, so it is only the fallback.
#ifdef ZON_HAS_LANGINFO
    const char* point = nl_langinfo(RADIXCHAR);
#else
    const std::lconv* conventions = std::localeconv();
    const char* point = conventions ? conventions->decimal_point : nullptr;
#endif
    return (point && point[0] != '\0') ? point[0] : '.';
}

}  // namespace

DecimalPointGuard::DecimalPointGuard()
    : DecimalPointGuard(ProcessDecimalPoint())
{
}

DecimalPointGuard::DecimalPointGuard(char decimalPoint)
    : _original(decimalPoint)
    , _current(decimalPoint)
{
}

bool DecimalPointGuard::Switch()
{
    if (_current != _original) {
        _current = _original;
        _switched = false;
        return true;
    }
    if (_current == '.' || _current == ',') {
        _current = _current == '.' ? ',' : '.';
        _switched = true;
        return true;
    }
    return false;
}

void DecimalPointGuard::Restore()
{
    if (_switched)
        Switch();
}
