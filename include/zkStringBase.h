/// zkStringBase: the library's growable byte string.
///
/// A string owns one heap buffer (array new) that holds its characters and a
/// terminating zero byte, so data() can be passed to any C function. The
/// characters are bytes with no encoding; characters inside the length may be
/// zero bytes when an operation with an explicit count put them there.
///
/// Growth adds a fixed slack of _sGrowLength (128) bytes to what is needed,
/// never a multiple of the size, and every growth goes through the virtual
/// resize(), so a derived class controls all reallocation. The buffer never
/// shrinks by itself. A length that would pass the 32-bit limit throws
/// std::bad_alloc, as a failed allocation does; nothing else is thrown.
///
/// Each string carries a CompareType that only its comparison operators read:
/// an operator between two strings compares exactly only when both strings are
/// case-sensitive. The named comparisons and searches take a caseSensitive
/// argument instead. Folding maps each byte, taken as a signed char, through
/// toupper/tolower of the current locale (ASCII letters under the default one).
///
/// Positions and lengths are unsigned 32-bit values counted from 0. Ranges
/// given as two positions include both ends. A count of 0 given with a
/// const char* means the text is measured with strlen.
///
/// One object is used by one thread at a time. NullStr is shared and only
/// read; changing _sGrowLength affects every later growth in every thread.
#ifndef ZK_STRING_BASE_H
#define ZK_STRING_BASE_H

#include "zkExport.h"

class ZK_API zkStringBase {
public:
    /// A fixed 32-bit type: setCompareType stores any value, and every
    /// non-zero value counts as case-sensitive.
    enum CompareType : int { CaseInsensitive = 0, CaseSensitive = 1 };

    /// Bits for stripWhite; they may be combined with |.
    enum StripType : unsigned { StripLeading = 0x001, StripTrailing = 0x010, StripEnds = 0x011, StripAll = 0x100 };

    /// No position: the result of every search that finds nothing. As the end
    /// of a range it means the last character; as the start of a backward
    /// search, the end of the string.
    static constexpr unsigned BadIndex = 0xFFFFFFFFu;

    /// Extra bytes added at every growth; read at each growth, so a change
    /// affects all later growth of all strings.
    static unsigned _sGrowLength;

    /// The shared empty string, returned by reference where there is no value.
    static const zkStringBase NullStr;

    /// ---- Construction, destruction, assignment ----

    /// Empty, capacity _sGrowLength, CaseSensitive.
    zkStringBase();
    /// Copy of s up to its zero byte, capacity strlen(s) + _sGrowLength; null s gives "".
    zkStringBase(const char* s);
    /// Copy of exactly n bytes of s (zero bytes included), capacity n + _sGrowLength;
    /// n == 0 or a null s gives "" (n is not measured here).
    zkStringBase(const char* s, unsigned n);
    /// Empty, with a buffer of exactly `capacity` bytes (at least 1, for the terminator).
    explicit zkStringBase(unsigned capacity);
    /// Same characters, capacity and compare type as other (capacity at least length + 1).
    zkStringBase(const zkStringBase& other);
    /// Adopts `buffer` (from array new, not null) without copying: length strlen(buffer),
    /// capacity `capacity`, or the length when it is 0. The third argument has no effect.
    zkStringBase(char* buffer, unsigned capacity, unsigned unused);
    /// Releases the buffer.
    virtual ~zkStringBase();

    /// Takes other's characters and compare type; grows first when other's
    /// length is at least the capacity.
    void operator=(const zkStringBase& other);
    /// Takes strlen(s) characters of s and keeps the compare type. A null s,
    /// or s equal to data(), changes nothing.
    void operator=(const char* s);
    /// The string becomes the single character ch (growing when needed).
    void operator=(char ch);
    /// Replaces the text with the n bytes at s (n == 0: the empty text; s may
    /// point into this string); the compare type stays.
    void assign(const char* s, unsigned n);

    /// Raw initialiser: allocates a buffer of `capacity` bytes without releasing
    /// any previous one, stores the length, writes the terminator at `length`
    /// and stores the compare type. Requires: a fresh object, length < capacity.
    void setData(unsigned capacity, unsigned length, CompareType type);

    /// ---- Editing; each returns the string itself ----

    /// Appends n bytes of s (n == 0: strlen(s)); a null s changes nothing.
    zkStringBase& append(const char* s, unsigned n = 0);
    zkStringBase& append(const zkStringBase& s);
    /// Appends one byte (a zero byte too).
    zkStringBase& append(char ch);
    /// Appends the "%ld" text of value.
    zkStringBase& append(long value);
    /// Appends the full "%f" text of value, whatever its magnitude.
    zkStringBase& append(double value);

    /// As append, but the text goes in front.
    zkStringBase& prepend(const char* s, unsigned n = 0);
    zkStringBase& prepend(const zkStringBase& s);
    zkStringBase& prepend(char ch);

    /// Inserts n bytes of s (n == 0: strlen(s)) before position pos; pos 0
    /// prepends, pos at or past the length appends; a null s changes nothing.
    zkStringBase& insert(const char* s, unsigned pos, unsigned n = 0);
    zkStringBase& insert(const zkStringBase& s, unsigned pos);

    /// Removes the characters from `from` to `to` inclusive; `to` past the end
    /// (or BadIndex) means the last character; from > to changes nothing.
    zkStringBase& del(unsigned from, unsigned to);
    /// The same as del.
    zkStringBase& erase(unsigned from, unsigned to);
    /// Removes the last n characters, all of them when n >= length.
    zkStringBase& cut(unsigned n);

    /// Replaces the first occurrence of `what` at or after start by `with`
    /// (a null `with` just removes it); no occurrence changes nothing.
    zkStringBase& replace(const char* what, const char* with, unsigned start, bool caseSensitive);
    /// del(from, to), then insert(s, from).
    zkStringBase& replace(const zkStringBase& s, unsigned from, unsigned to);
    /// del(from, to), then insert(s, from, 0).
    zkStringBase& replace(const char* s, unsigned from, unsigned to);

    /// Appends s's characters from `from` to `to` inclusive; `from` past s's
    /// end, or `to` before `from` after clamping, appends nothing.
    zkStringBase& appendSubString(const zkStringBase& s, unsigned from, unsigned to);

    zkStringBase& operator+=(const zkStringBase& s);
    zkStringBase& operator+=(const char* s);
    zkStringBase& operator+=(char ch);
    zkStringBase& operator+=(long value);
    zkStringBase& operator+=(double value);

    /// A copy of a (a's capacity and compare type) with b's text appended up to
    /// b's first zero byte.
    static zkStringBase concatenate(const zkStringBase& a, const zkStringBase& b);

    /// Appends ch; meant for loops after reserve(), but grows if there is no room.
    void fappend(char ch);
    /// Replaces the buffer by one of newCapacity bytes (never fewer than
    /// length + 1), keeping the characters. All growth goes through here.
    virtual void resize(unsigned newCapacity);
    /// Calls resize(n), also when n is below the present capacity (never below length + 1).
    void reserve(unsigned n);
    /// Length 0; the capacity stays.
    void makeNull();
    bool isNull() const { return m_length == 0; }

    /// The characters and terminator; never null.
    const char* data() const { return m_data; }
    unsigned length() const { return m_length; }
    unsigned capacity() const { return m_capacity; }
    /// The character at i; requires i <= length (length gives the terminator).
    char at(unsigned i) const { return m_data[i]; }
    char operator[](unsigned i) const { return m_data[i]; }
    char& at(unsigned i) { return m_data[i]; }
    char& operator[](unsigned i) { return m_data[i]; }
    /// The last character, or the zero byte of an empty string.
    char getLast() const { return m_length ? m_data[m_length - 1] : '\0'; }

    /// ---- Comparison ----

    /// Negative, zero or positive as this string sorts before, equal to or
    /// after the other. Exact: -1 or +1 at the first differing byte (unsigned).
    /// Folded: the difference of the folded bytes there. On an equal common
    /// prefix the shorter string sorts first.
    short compareTo(const zkStringBase& other, bool caseSensitive = true) const;
    /// The same against s (requires s != nullptr).
    short compareTo(const char* s, bool caseSensitive = true) const;
    /// False when the lengths differ; else compareTo(...) == 0.
    bool equals(const zkStringBase& other, bool caseSensitive = true) const;
    bool equals(const char* s, bool caseSensitive = true) const;
    bool greaterThan(const zkStringBase& other, bool caseSensitive = true) const;
    bool greaterThan(const char* s, bool caseSensitive = true) const;
    bool lessThan(const zkStringBase& other, bool caseSensitive = true) const;
    bool lessThan(const char* s, bool caseSensitive = true) const;

    /// Exact only when both strings are case-sensitive.
    bool operator==(const zkStringBase& other) const;
    bool operator!=(const zkStringBase& other) const;
    bool operator<(const zkStringBase& other) const;
    bool operator>(const zkStringBase& other) const;
    /// By this string's compare type; a null s makes all four false.
    bool operator==(const char* s) const;
    bool operator!=(const char* s) const;
    bool operator<(const char* s) const;
    bool operator>(const char* s) const;

    void setCompareType(CompareType type) { m_compareType = type; }
    CompareType getCompareType() const { return m_compareType; }

    /// Folded comparison of n bytes: the first non-zero difference of
    /// toupper(a[i]) - toupper(b[i]), or 0.
    static int imemcmp(const char* a, const char* b, unsigned n);
    /// Whether strcmp (exact) or _stricmp (folded) gives 0.
    static bool equalStrings(const char* a, const char* b, bool caseSensitive);
    /// Whether strcmp (exact) or _stricmp (folded) gives a negative result.
    static bool lessThanStrings(const char* a, const char* b, bool caseSensitive);

    /// ---- Search; each returns a position or BadIndex ----

    /// The first position at or after start holding ch.
    unsigned find(char ch, unsigned start = 0, bool caseSensitive = true) const;
    /// The first position at or after start where the n bytes of s (n == 0:
    /// strlen(s)) occur whole; an empty pattern is found nowhere.
    unsigned find(const char* s, unsigned start, unsigned n, bool caseSensitive) const;
    unsigned find(const zkStringBase& s, unsigned start = 0, bool caseSensitive = true) const;
    /// The last position at or before start holding ch (start BadIndex: the end).
    unsigned rfind(char ch, unsigned start = BadIndex, bool caseSensitive = true) const;
    /// The last position at or before start where the n bytes of s occur whole.
    unsigned rfind(const char* s, unsigned start, unsigned n, bool caseSensitive) const;
    unsigned rfind(const zkStringBase& s, unsigned start = BadIndex, bool caseSensitive = true) const;
    /// The first position at or after start holding any of the n bytes of set.
    unsigned findFirstOf(const char* set, unsigned start, unsigned n, bool caseSensitive) const;
    unsigned findFirstOf(const zkStringBase& set, unsigned start = 0, bool caseSensitive = true) const;

    /// ---- Cutting ----

    /// A new CaseSensitive string of the characters from `from` to `to`
    /// inclusive (`to` past the end: up to the end); empty when from is past
    /// the end or after to.
    zkStringBase subString(unsigned from, unsigned to) const;
    /// Appends to out the characters from `from` up to the first sep within
    /// [from, to] and returns that separator's position. With no separator, or
    /// an empty or invalid range, returns BadIndex and, when clearOnFail is
    /// non-zero, empties out. out is never emptied at the start.
    unsigned subString(char sep, zkStringBase& out, unsigned from, unsigned to, int clearOnFail) const;
    /// The same, where any byte of seps is a separator (exact comparison).
    unsigned subString(const zkStringBase& seps, zkStringBase& out, unsigned from, unsigned to, int clearOnFail) const;

    /// ---- Conversion, case and whitespace ----

    /// strtol(data, 0, 10): 0 when there are no digits.
    long asLong() const;
    /// strtod(data, 0): 0 when nothing is accepted.
    double asDouble() const;
    /// Replaces the text with the "%.*f" text of value; the compare type stays.
    void fromDouble(double value, int decimals);
    /// Replaces the text with the "%ld" text of value; the compare type stays.
    void fromLong(long value);
    /// Whether the whole text is a decimal number: optional leading blanks,
    /// one sign, digits with at most one point, an optional exponent.
    bool isNumber() const;
    /// The first position at or after pos not holding a space, tab, CR or LF;
    /// the length when there is none; pos itself when pos >= length.
    unsigned skipNextWhite(unsigned pos) const;
    /// Every byte through tolower / toupper.
    void toLower();
    void toUpper();
    /// The first byte, and every byte after a whitespace byte, through toupper.
    void firstUpper();
    /// Lower-case letters become upper-case and upper-case letters lower-case.
    void invertCase();
    /// Removes whitespace (isspace) as the bits ask and returns the string.
    zkStringBase& stripWhite(StripType bits);

protected:
    char* m_data;
    unsigned m_length;
    unsigned m_capacity;
    CompareType m_compareType;

private:
    /// Makes room for `added` more characters and the terminator, by the
    /// fixed-slack rule; throws std::bad_alloc past the 32-bit length limit.
    void growFor(unsigned added);
    /// Makes room for a text of n characters assigned over the present one.
    void growForAssign(unsigned n);
    /// Puts n bytes of s at pos (pos <= length), moving the rest up.
    void spliceIn(unsigned pos, const char* s, unsigned n);
    /// Replaces the text with n bytes of s (which may overlap the buffer).
    void assignBytes(const char* s, unsigned n);
    /// The field cutter behind both subString forms, with `count` separator bytes.
    unsigned cutField(const char* seps, unsigned count, zkStringBase& out, unsigned from, unsigned to,
                      int clearOnFail) const;
};

inline zkStringBase::StripType operator|(zkStringBase::StripType a, zkStringBase::StripType b) {
    return static_cast<zkStringBase::StripType>(static_cast<unsigned>(a) | static_cast<unsigned>(b));
}

#endif
