#pragma once

#include "pells/xml/detail/char_class.h"

#if defined(__SSE2__) && defined(__GNUC__)
#define PELLS_SCAN_SSE2
#include <emmintrin.h>
#endif

/// \file
/// Finds the ends of names, values and character data, many characters at a time where the
/// processor can. Each EndOf... tells which characters end a run: for one, and as a mask for 16.

namespace pells::detail {

#ifdef PELLS_SCAN_SSE2
/// Marks the bytes that equal a character.
inline __m128i equal(__m128i bytes, char character) {
    return _mm_cmpeq_epi8(bytes, _mm_set1_epi8(character));
}

inline __m128i spaces(__m128i bytes) {
    return _mm_or_si128(_mm_or_si128(equal(bytes, ' '), equal(bytes, '\n')),
                        _mm_or_si128(equal(bytes, '\r'), equal(bytes, '\t')));
}

inline __m128i belowSpace(__m128i bytes) {
    return _mm_cmpeq_epi8(bytes, _mm_min_epu8(bytes, _mm_set1_epi8(' ' - 1)));
}
#endif

/// What ends plain character data: markup or a reference.
struct EndOfText {
    bool operator()(char c) const { return c == '<' || c == '&'; }
#ifdef PELLS_SCAN_SSE2
    __m128i operator()(__m128i bytes) const {
        return _mm_or_si128(equal(bytes, '<'), equal(bytes, '&'));
    }
#endif
};

/// What ends the plain part of an attribute value.
struct EndOfValue {
    bool operator()(char c) const { return c == quote || c == '<' || c == '&'; }
#ifdef PELLS_SCAN_SSE2
    __m128i operator()(__m128i bytes) const {
        return _mm_or_si128(equal(bytes, quote), EndOfText()(bytes));
    }
#endif
    char quote;
};

/// What ends the part of a comment that needs no second look.
struct EndOfComment {
    bool operator()(char c) const { return !isOf(CLASS_COMMENT, c); }
#ifdef PELLS_SCAN_SSE2
    __m128i operator()(__m128i bytes) const {
        const __m128i controls = _mm_andnot_si128(spaces(bytes), belowSpace(bytes));
        return _mm_or_si128(equal(bytes, '-'), controls);
    }
#endif
};

struct EndOfSpace {
    bool operator()(char c) const { return !isOf(CLASS_SPACE, c); }
#ifdef PELLS_SCAN_SSE2
    __m128i operator()(__m128i bytes) const {
        return _mm_cmpeq_epi8(spaces(bytes), _mm_setzero_si128());
    }
#endif
};

struct EndOfName {
    bool operator()(char c) const { return !isOf(CLASS_NAME, c); }
};

/// The first character from `next` to `limit` that ends a run, or `limit`.
template <class End>
const char* scanShort(const char* next, const char* limit, End isEnd) {
    while (next != limit && !isEnd(*next))
        ++next;
    return next;
}

template <class End>
const char* scan(const char* next, const char* limit, End isEnd) {
#ifdef PELLS_SCAN_SSE2
    for (; limit - next >= 16; next += 16) {
        const __m128i bytes = _mm_loadu_si128(reinterpret_cast<const __m128i*>(next));
        const int marks = _mm_movemask_epi8(isEnd(bytes));
        if (marks != 0)
            return next + __builtin_ctz(static_cast<unsigned>(marks));
    }
#endif
    return scanShort(next, limit, isEnd);
}

/// White space is nothing, one character between attributes, or the indentation of a line.
inline const char* scanSpace(const char* next, const char* limit) {
    const EndOfSpace isEnd;
    if (next == limit || isEnd(*next))
        return next;
    ++next;
    return next == limit || isEnd(*next) ? next : scan(next, limit, isEnd);
}

/// Names are short and alike, so that guessing their ends is quicker than computing them.
inline const char* scan(const char* next, const char* limit, EndOfName isEnd) {
    return scanShort(next, limit, isEnd);
}

}  // namespace pells::detail
