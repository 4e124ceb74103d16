#pragma once

#include <locale>

namespace pells::detail {

/// A locale that differs from the classic one in its speed: it writes numbers without width,
/// precision or other flags of the stream's several times as fast. The text is the same.
/// Implementation detail of the log; not installed.
std::locale fastClassicLocale();

}  // namespace pells::detail
