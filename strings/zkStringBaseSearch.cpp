#include "zkStringBase.h"

#include <cstring>

#include "internal/zkCaseTables.h"
#include "zkFilename.h"

namespace {

// The values toupper can return for a signed char lie in [-128, 255]; a set
// of folded bytes is marked in a table indexed from -128.
constexpr int kFoldedMin = -128;
constexpr int kFoldedRange = 384;
constexpr int kByteRange = 256;

// From this many bytes to search on, a folded search first builds a skip
// table, whose cost is about that of trying this many positions one by one.
constexpr unsigned kSkipTableMinSpan = 512;

short signOfExactDifference(const char* a, const char* b, unsigned n) {
    int d = n ? std::memcmp(a, b, n) : 0;
    return static_cast<short>(d < 0 ? -1 : d > 0 ? 1 : 0);
}

short orderByLength(unsigned a, unsigned b) {
    return static_cast<short>(a < b ? -1 : a > b ? 1 : 0);
}

int foldedDifference(const zkCaseTables& fold, const char* a, const char* b, unsigned n) {
    for (unsigned i = 0; i < n; ++i) {
        int d = fold.upper(a[i]) - fold.upper(b[i]);
        if (d) return d;
    }
    return 0;
}

// The first position i in [start, last] where the n >= 2 bytes at data + i
// match s as zkStringBase::find decides it (first byte through tolower, all
// bytes through toupper), or BadIndex. A match needs every byte of the window
// to fold as the pattern's byte does, so after a failed window the search may
// move on to the next window that lines up the folded value of this window's
// last byte with an equal folded value of the pattern (a bad-character skip).
// Every window it stops at is checked with the same test the byte-by-byte
// loop uses, so both give the same position in any locale.
unsigned skipFoldedFind(const zkCaseTables& fold, const char* data, unsigned start, unsigned last, const char* s,
                        unsigned n) {
    unsigned shift[kFoldedRange];
    for (unsigned& d : shift) d = n;
    for (unsigned j = 0; j + 1 < n; ++j) shift[fold.upper(s[j]) - kFoldedMin] = n - 1 - j;
    const int first = fold.lower(s[0]);
    const int tail = fold.upper(s[n - 1]);
    // i never passes last + n, the string's length, so it cannot wrap.
    for (unsigned i = start; i <= last;) {
        const int c = fold.upper(data[i + n - 1]);
        if (c == tail && fold.lower(data[i]) == first && foldedDifference(fold, data + i, s, n) == 0) return i;
        i += shift[c - kFoldedMin];
    }
    return zkStringBase::BadIndex;
}

// The first byte in [p, end) that equals any of the n bytes of set, or null.
// Sets of one or two bytes (a comma, a line end) need no table.
const char* firstOfSet(const char* p, const char* end, const char* set, unsigned n) {
    if (n == 1) return static_cast<const char*>(std::memchr(p, set[0], static_cast<size_t>(end - p)));
    if (n == 2) {
        char a = set[0], b = set[1];
        for (; p < end; ++p)
            if (*p == a || *p == b) return p;
        return nullptr;
    }
    bool member[kByteRange] = {};
    for (unsigned j = 0; j < n; ++j) member[static_cast<unsigned char>(set[j])] = true;
    for (; p < end; ++p)
        if (member[static_cast<unsigned char>(*p)]) return p;
    return nullptr;
}

}  // namespace

// ---- Comparison ----

int zkStringBase::imemcmp(const char* a, const char* b, unsigned n) {
    return foldedDifference(zkCaseTables(), a, b, n);
}

short zkStringBase::compareTo(const zkStringBase& other, bool caseSensitive) const {
    unsigned common = m_length < other.m_length ? m_length : other.m_length;
    int d = caseSensitive ? signOfExactDifference(m_data, other.m_data, common) : imemcmp(m_data, other.m_data, common);
    if (d) return static_cast<short>(d);
    return orderByLength(m_length, other.m_length);
}

short zkStringBase::compareTo(const char* s, bool caseSensitive) const {
    unsigned n = static_cast<unsigned>(std::strlen(s));
    unsigned common = m_length < n ? m_length : n;
    int d = caseSensitive ? signOfExactDifference(m_data, s, common) : imemcmp(m_data, s, common);
    if (d) return static_cast<short>(d);
    return orderByLength(m_length, n);
}

bool zkStringBase::equals(const zkStringBase& other, bool caseSensitive) const {
    if (m_length != other.m_length) return false;
    if (caseSensitive) return m_length == 0 || std::memcmp(m_data, other.m_data, m_length) == 0;
    return imemcmp(m_data, other.m_data, m_length) == 0;
}

bool zkStringBase::equals(const char* s, bool caseSensitive) const {
    if (std::strlen(s) != m_length) return false;
    if (caseSensitive) return m_length == 0 || std::memcmp(m_data, s, m_length) == 0;
    return imemcmp(m_data, s, m_length) == 0;
}

bool zkStringBase::greaterThan(const zkStringBase& other, bool caseSensitive) const {
    return compareTo(other, caseSensitive) > 0;
}

bool zkStringBase::greaterThan(const char* s, bool caseSensitive) const {
    return compareTo(s, caseSensitive) > 0;
}

bool zkStringBase::lessThan(const zkStringBase& other, bool caseSensitive) const {
    return compareTo(other, caseSensitive) < 0;
}

bool zkStringBase::lessThan(const char* s, bool caseSensitive) const {
    return compareTo(s, caseSensitive) < 0;
}

// Operators between two strings compare exactly only when both are
// case-sensitive; any non-zero compare type counts as case-sensitive.
bool zkStringBase::operator==(const zkStringBase& other) const {
    return equals(other, m_compareType != CaseInsensitive && other.m_compareType != CaseInsensitive);
}

bool zkStringBase::operator!=(const zkStringBase& other) const {
    return !(*this == other);
}

bool zkStringBase::operator<(const zkStringBase& other) const {
    return lessThan(other, m_compareType != CaseInsensitive && other.m_compareType != CaseInsensitive);
}

bool zkStringBase::operator>(const zkStringBase& other) const {
    return greaterThan(other, m_compareType != CaseInsensitive && other.m_compareType != CaseInsensitive);
}

bool zkStringBase::operator==(const char* s) const {
    return s != nullptr && equals(s, m_compareType != CaseInsensitive);
}

bool zkStringBase::operator!=(const char* s) const {
    return s != nullptr && !equals(s, m_compareType != CaseInsensitive);
}

bool zkStringBase::operator<(const char* s) const {
    return s != nullptr && lessThan(s, m_compareType != CaseInsensitive);
}

bool zkStringBase::operator>(const char* s) const {
    return s != nullptr && greaterThan(s, m_compareType != CaseInsensitive);
}

bool zkStringBase::equalStrings(const char* a, const char* b, bool caseSensitive) {
    return (caseSensitive ? std::strcmp(a, b) : _stricmp(a, b)) == 0;
}

bool zkStringBase::lessThanStrings(const char* a, const char* b, bool caseSensitive) {
    return (caseSensitive ? std::strcmp(a, b) : _stricmp(a, b)) < 0;
}

// ---- Search ----

unsigned zkStringBase::find(char ch, unsigned start, bool caseSensitive) const {
    if (start >= m_length) return BadIndex;
    if (caseSensitive) {
        const void* hit = std::memchr(m_data + start, ch, m_length - start);
        return hit ? static_cast<unsigned>(static_cast<const char*>(hit) - m_data) : BadIndex;
    }
    zkCaseTables fold;
    int wanted = fold.upper(ch);
    for (unsigned i = start; i < m_length; ++i)
        if (fold.upper(m_data[i]) == wanted) return i;
    return BadIndex;
}

unsigned zkStringBase::find(const char* s, unsigned start, unsigned n, bool caseSensitive) const {
    if (start >= m_length) return BadIndex;
    if (n == 0) n = static_cast<unsigned>(std::strlen(s));
    if (n == 0 || m_length - start < n) return BadIndex;
    if (caseSensitive) {
        const void* hit = memmem(m_data + start, m_length - start, s, n);
        return hit ? static_cast<unsigned>(static_cast<const char*>(hit) - m_data) : BadIndex;
    }
    // A candidate's first byte is matched through tolower, the whole pattern
    // through toupper, as the folded comparison everywhere else does.
    zkCaseTables fold;
    int first = fold.lower(s[0]);
    unsigned last = m_length - n;
    if (n >= 2 && m_length - start >= kSkipTableMinSpan) return skipFoldedFind(fold, m_data, start, last, s, n);
    for (unsigned i = start; i <= last; ++i) {
        if (fold.lower(m_data[i]) == first && foldedDifference(fold, m_data + i, s, n) == 0) return i;
    }
    return BadIndex;
}

unsigned zkStringBase::find(const zkStringBase& s, unsigned start, bool caseSensitive) const {
    if (s.m_length == 0) return BadIndex;
    return find(s.m_data, start, s.m_length, caseSensitive);
}

unsigned zkStringBase::rfind(char ch, unsigned start, bool caseSensitive) const {
    if (start == BadIndex) start = m_length - 1;
    if (start >= m_length) return BadIndex;
    if (caseSensitive) {
        const void* hit = memrchr(m_data, ch, start + 1ull);
        return hit ? static_cast<unsigned>(static_cast<const char*>(hit) - m_data) : BadIndex;
    }
    zkCaseTables fold;
    int wanted = fold.upper(ch);
    for (unsigned i = start + 1; i-- > 0;)
        if (fold.upper(m_data[i]) == wanted) return i;
    return BadIndex;
}

unsigned zkStringBase::rfind(const char* s, unsigned start, unsigned n, bool caseSensitive) const {
    if (start == BadIndex) start = m_length - 1;
    if (start >= m_length) return BadIndex;
    if (n == 0) n = static_cast<unsigned>(std::strlen(s));
    if (n == 0 || n > m_length) return BadIndex;
    unsigned top = start < m_length - n ? start : m_length - n;
    if (caseSensitive) {
        // memrchr finds the candidates' first bytes from the top down.
        unsigned long long span = top + 1ull;
        while (span > 0) {
            const void* hit = memrchr(m_data, s[0], span);
            if (!hit) return BadIndex;
            unsigned i = static_cast<unsigned>(static_cast<const char*>(hit) - m_data);
            if (std::memcmp(m_data + i, s, n) == 0) return i;
            span = i;
        }
        return BadIndex;
    }
    zkCaseTables fold;
    for (unsigned i = top + 1; i-- > 0;)
        if (foldedDifference(fold, m_data + i, s, n) == 0) return i;
    return BadIndex;
}

unsigned zkStringBase::rfind(const zkStringBase& s, unsigned start, bool caseSensitive) const {
    if (s.m_length == 0) return BadIndex;
    return rfind(s.m_data, start, s.m_length, caseSensitive);
}

unsigned zkStringBase::findFirstOf(const char* set, unsigned start, unsigned n, bool caseSensitive) const {
    if (start >= m_length) return BadIndex;
    if (n == 0) n = static_cast<unsigned>(std::strlen(set));
    if (n == 0) return BadIndex;
    if (caseSensitive) {
        const char* hit = firstOfSet(m_data + start, m_data + m_length, set, n);
        return hit ? static_cast<unsigned>(hit - m_data) : BadIndex;
    }
    zkCaseTables fold;
    bool member[kFoldedRange] = {};
    for (unsigned j = 0; j < n; ++j) member[fold.upper(set[j]) - kFoldedMin] = true;
    for (unsigned i = start; i < m_length; ++i)
        if (member[fold.upper(m_data[i]) - kFoldedMin]) return i;
    return BadIndex;
}

unsigned zkStringBase::findFirstOf(const zkStringBase& set, unsigned start, bool caseSensitive) const {
    if (set.m_length == 0) return BadIndex;
    return findFirstOf(set.m_data, start, set.m_length, caseSensitive);
}

// ---- Cutting ----

zkStringBase zkStringBase::subString(unsigned from, unsigned to) const {
    if (from >= m_length) return zkStringBase();
    if (to >= m_length) to = m_length - 1;
    if (from > to) return zkStringBase();
    return zkStringBase(m_data + from, to - from + 1);
}

unsigned zkStringBase::subString(char sep, zkStringBase& out, unsigned from, unsigned to, int clearOnFail) const {
    return cutField(&sep, 1, out, from, to, clearOnFail);
}

unsigned zkStringBase::subString(const zkStringBase& seps, zkStringBase& out, unsigned from, unsigned to,
                                 int clearOnFail) const {
    return cutField(seps.m_data, seps.m_length, out, from, to, clearOnFail);
}

unsigned zkStringBase::cutField(const char* seps, unsigned count, zkStringBase& out, unsigned from, unsigned to,
                                int clearOnFail) const {
    unsigned last = to >= m_length ? m_length - 1 : to;
    if (m_length == 0 || from == BadIndex || from > last) {
        if (clearOnFail) out.makeNull();
        return BadIndex;
    }
    const char* hit = count ? firstOfSet(m_data + from, m_data + last + 1, seps, count) : nullptr;
    if (hit) {
        unsigned at = static_cast<unsigned>(hit - m_data);
        out.spliceIn(out.m_length, m_data + from, at - from);
        return at;
    }
    // No separator: the field runs to the end of the range, and is kept only
    // when the caller asked for that.
    out.spliceIn(out.m_length, m_data + from, last - from + 1);
    if (clearOnFail) out.makeNull();
    return BadIndex;
}
