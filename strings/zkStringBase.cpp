#include "zkStringBase.h"

#include <cassert>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <new>
#include <string>

#include "internal/zkStringRules.h"

unsigned zkStringBase::_sGrowLength = 128;
const zkStringBase zkStringBase::NullStr;

namespace {

bool pointsInto(const char* p, const char* buffer, unsigned size) {
    // Compared as addresses so that unrelated pointers are handled too.
    auto addr = reinterpret_cast<std::uintptr_t>(p);
    auto base = reinterpret_cast<std::uintptr_t>(buffer);
    return addr >= base && addr < base + size;
}

}  // namespace

// ---- Construction, destruction, assignment ----

zkStringBase::zkStringBase() : m_data(nullptr), m_length(0), m_capacity(0), m_compareType(CaseSensitive) {
    setData(_sGrowLength ? _sGrowLength : 1, 0, CaseSensitive);
}

zkStringBase::zkStringBase(const char* s) : zkStringBase(s, s ? static_cast<unsigned>(std::strlen(s)) : 0) {}

zkStringBase::zkStringBase(const char* s, unsigned n)
    : m_data(nullptr), m_length(0), m_capacity(0), m_compareType(CaseSensitive) {
    if (s == nullptr) n = 0;
    unsigned long long capacity = static_cast<unsigned long long>(n) + _sGrowLength;
    if (capacity <= n) capacity = n + 1ull;
    if (capacity > kZkMaxCapacity) throw std::bad_alloc();
    setData(static_cast<unsigned>(capacity), n, CaseSensitive);
    if (n) std::memcpy(m_data, s, n);
}

zkStringBase::zkStringBase(unsigned capacity)
    : m_data(nullptr), m_length(0), m_capacity(0), m_compareType(CaseSensitive) {
    setData(capacity ? capacity : 1, 0, CaseSensitive);
}

zkStringBase::zkStringBase(const zkStringBase& other)
    : m_data(nullptr), m_length(0), m_capacity(0), m_compareType(CaseSensitive) {
    // An adopted buffer may record its length as its capacity: leave room for
    // the terminator all the same.
    unsigned capacity = other.m_capacity > other.m_length ? other.m_capacity : other.m_length + 1;
    setData(capacity, other.m_length, other.m_compareType);
    std::memcpy(m_data, other.m_data, other.m_length);
}

zkStringBase::zkStringBase(char* buffer, unsigned capacity, unsigned)
    : m_data(buffer),
      m_length(static_cast<unsigned>(std::strlen(buffer))),
      m_capacity(capacity ? capacity : m_length),
      m_compareType(CaseSensitive) {}

zkStringBase::~zkStringBase() {
    delete[] m_data;
}

void zkStringBase::setData(unsigned capacity, unsigned length, CompareType type) {
    assert(length < capacity);
    m_data = new char[capacity];
    m_capacity = capacity;
    m_length = length;
    m_data[length] = '\0';
    m_compareType = type;
}

void zkStringBase::operator=(const zkStringBase& other) {
    if (this == &other) return;
    assignBytes(other.m_data, other.m_length);
    m_compareType = other.m_compareType;
}

void zkStringBase::operator=(const char* s) {
    if (s == nullptr || s == m_data) return;
    assignBytes(s, static_cast<unsigned>(std::strlen(s)));
}

void zkStringBase::operator=(char ch) {
    assignBytes(&ch, 1);
}

void zkStringBase::assign(const char* s, unsigned n) {
    assignBytes(s, n);
}

void zkStringBase::assignBytes(const char* s, unsigned n) {
    // A source inside this buffer is shorter than the capacity, so it never
    // triggers the growth that would release it.
    if (n >= m_capacity) growForAssign(n);
    std::memmove(m_data, s, n);
    m_length = n;
    m_data[n] = '\0';
}

// ---- Growth ----

void zkStringBase::growFor(unsigned added) {
    unsigned long long needed = static_cast<unsigned long long>(m_length) + added + 1;
    if (needed <= m_capacity) return;
    if (needed > kZkMaxCapacity) throw std::bad_alloc();
    unsigned long long capacity = needed + _sGrowLength;
    resize(static_cast<unsigned>(capacity > kZkMaxCapacity ? kZkMaxCapacity : capacity));
}

void zkStringBase::growForAssign(unsigned n) {
    if (n < m_capacity) return;
    if (n >= kZkMaxCapacity) throw std::bad_alloc();
    // The old characters are about to be overwritten: let resize copy none.
    m_length = 0;
    m_data[0] = '\0';
    resize(zkAssignCapacity(n));
}

void zkStringBase::resize(unsigned newCapacity) {
    if (newCapacity < m_length + 1ull) newCapacity = m_length + 1;
    char* buffer = new char[newCapacity];
    std::memcpy(buffer, m_data, m_length + 1ull);
    delete[] m_data;
    m_data = buffer;
    m_capacity = newCapacity;
}

void zkStringBase::reserve(unsigned n) {
    resize(n < m_length + 1ull ? m_length + 1 : n);
}

void zkStringBase::makeNull() {
    m_length = 0;
    m_data[0] = '\0';
}

// ---- Editing ----

void zkStringBase::spliceIn(unsigned pos, const char* s, unsigned n) {
    if (n == 0) return;
    // The limit is tested before anything is read from s.
    if (static_cast<unsigned long long>(m_length) + n + 1 > kZkMaxCapacity) throw std::bad_alloc();
    if (pos == m_length && !pointsInto(s, m_data, m_capacity)) {
        // An append from outside the buffer: nothing to move or protect but
        // the byte at the end, which goes behind the new text as below.
        growFor(n);
        m_data[m_length + n] = m_data[m_length];
        std::memcpy(m_data + m_length, s, n);
        m_length += n;
        return;
    }
    std::string copy;
    if (pointsInto(s, m_data, m_capacity)) {
        // The source is part of this string: moving the text or replacing the
        // buffer would change it underneath us.
        copy.assign(s, n);
        s = copy.data();
    }
    growFor(n);
    std::memmove(m_data + pos + n, m_data + pos, m_length - pos + 1ull);
    std::memcpy(m_data + pos, s, n);
    m_length += n;
}

zkStringBase& zkStringBase::append(const char* s, unsigned n) {
    if (s == nullptr) return *this;
    if (n == 0) n = static_cast<unsigned>(std::strlen(s));
    if (n != 0 && static_cast<unsigned long long>(m_length) + n < m_capacity && !pointsInto(s, m_data, m_capacity)) {
        // It fits and comes from elsewhere: what spliceIn does, without its
        // growth and overlap checks.
        m_data[m_length + n] = m_data[m_length];
        std::memcpy(m_data + m_length, s, n);
        m_length += n;
        return *this;
    }
    spliceIn(m_length, s, n);
    return *this;
}

zkStringBase& zkStringBase::append(const zkStringBase& s) {
    return append(s.m_data, s.m_length);
}

zkStringBase& zkStringBase::append(char ch) {
    growFor(1);
    m_data[m_length++] = ch;
    m_data[m_length] = '\0';
    return *this;
}

zkStringBase& zkStringBase::append(long value) {
    char text[kZkLongTextSize];
    std::snprintf(text, sizeof text, "%ld", value);
    return append(text, 0);
}

zkStringBase& zkStringBase::append(double value) {
    // The "%f" text of a large magnitude runs to hundreds of characters:
    // measure it, then format it straight into the buffer.
    int n = std::snprintf(nullptr, 0, "%f", value);
    if (n <= 0) return *this;
    growFor(static_cast<unsigned>(n));
    std::snprintf(m_data + m_length, static_cast<size_t>(n) + 1, "%f", value);
    m_length += static_cast<unsigned>(n);
    return *this;
}

zkStringBase& zkStringBase::prepend(const char* s, unsigned n) {
    if (s == nullptr) return *this;
    if (n == 0) n = static_cast<unsigned>(std::strlen(s));
    spliceIn(0, s, n);
    return *this;
}

zkStringBase& zkStringBase::prepend(const zkStringBase& s) {
    return prepend(s.m_data, s.m_length);
}

zkStringBase& zkStringBase::prepend(char ch) {
    spliceIn(0, &ch, 1);
    return *this;
}

zkStringBase& zkStringBase::insert(const char* s, unsigned pos, unsigned n) {
    if (s == nullptr) return *this;
    if (n == 0) n = static_cast<unsigned>(std::strlen(s));
    spliceIn(pos < m_length ? pos : m_length, s, n);
    return *this;
}

zkStringBase& zkStringBase::insert(const zkStringBase& s, unsigned pos) {
    if (pos == 0) return prepend(s);
    return insert(s.m_data, pos, s.m_length);
}

zkStringBase& zkStringBase::del(unsigned from, unsigned to) {
    if (m_length == 0) return *this;
    if (to >= m_length) to = m_length - 1;
    if (from > to) return *this;
    std::memmove(m_data + from, m_data + to + 1, m_length - to);
    m_length -= to - from + 1;
    return *this;
}

zkStringBase& zkStringBase::erase(unsigned from, unsigned to) {
    return del(from, to);
}

zkStringBase& zkStringBase::cut(unsigned n) {
    m_length = n >= m_length ? 0 : m_length - n;
    m_data[m_length] = '\0';
    return *this;
}

zkStringBase& zkStringBase::replace(const char* what, const char* with, unsigned start, bool caseSensitive) {
    unsigned at = find(what, start, 0, caseSensitive);
    if (at == BadIndex) return *this;
    del(at, at + static_cast<unsigned>(std::strlen(what)) - 1);
    return insert(with, at, 0);
}

zkStringBase& zkStringBase::replace(const zkStringBase& s, unsigned from, unsigned to) {
    del(from, to);
    return insert(s, from);
}

zkStringBase& zkStringBase::replace(const char* s, unsigned from, unsigned to) {
    del(from, to);
    return insert(s, from, 0);
}

zkStringBase& zkStringBase::appendSubString(const zkStringBase& s, unsigned from, unsigned to) {
    if (from >= s.m_length) return *this;
    if (to >= s.m_length) to = s.m_length - 1;
    if (to < from) return *this;
    spliceIn(m_length, s.m_data + from, to - from + 1);
    return *this;
}

zkStringBase& zkStringBase::operator+=(const zkStringBase& s) {
    return append(s);
}

zkStringBase& zkStringBase::operator+=(const char* s) {
    return append(s, 0);
}

zkStringBase& zkStringBase::operator+=(char ch) {
    return append(ch);
}

zkStringBase& zkStringBase::operator+=(long value) {
    return append(value);
}

zkStringBase& zkStringBase::operator+=(double value) {
    return append(value);
}

zkStringBase zkStringBase::concatenate(const zkStringBase& a, const zkStringBase& b) {
    zkStringBase result(a);
    result.append(b.m_data, 0);
    return result;
}

void zkStringBase::fappend(char ch) {
    append(ch);
}
