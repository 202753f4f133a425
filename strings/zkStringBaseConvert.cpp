#include "zkStringBase.h"

#include <cstdio>
#include <cstdlib>

#include "internal/zkCaseTables.h"
#include "internal/zkCharRules.h"
#include "internal/zkStringRules.h"

namespace {

// Room for the "%.*f" text of an ordinary number; longer texts are formatted
// straight into the string's buffer.
constexpr int kNumberTextSize = 128;

}  // namespace

long zkStringBase::asLong() const {
    return std::strtol(m_data, nullptr, 10);
}

double zkStringBase::asDouble() const {
    return std::strtod(m_data, nullptr);
}

void zkStringBase::fromDouble(double value, int decimals) {
    char text[kNumberTextSize];
    int n = std::snprintf(text, sizeof text, "%.*f", decimals, value);
    if (n < 0) return;
    if (n < kNumberTextSize) {
        assignBytes(text, static_cast<unsigned>(n));
        return;
    }
    growForAssign(static_cast<unsigned>(n));
    std::snprintf(m_data, static_cast<size_t>(n) + 1, "%.*f", decimals, value);
    m_length = static_cast<unsigned>(n);
}

void zkStringBase::fromLong(long value) {
    char text[kZkLongTextSize];
    int n = std::snprintf(text, sizeof text, "%ld", value);
    assignBytes(text, static_cast<unsigned>(n));
}

bool zkStringBase::isNumber() const {
    bool digit = false, sign = false, point = false, exponent = false;
    for (unsigned i = 0; i < m_length; ++i) {
        char c = m_data[i];
        if (zkIsDigit(c)) {
            digit = true;
        } else if (c == '.') {
            if (point || exponent) return false;
            point = true;
        } else if (c == '+' || c == '-') {
            if (sign || digit) return false;
            if (i + 1 >= m_length || !zkIsDigit(m_data[i + 1])) return false;
            sign = true;
        } else if (c == 'E' || c == 'e') {
            if (!digit || exponent) return false;
            exponent = true;
            if (i + 1 >= m_length) return false;
            char next = m_data[i + 1];
            if (next != '+' && next != '-' && !zkIsDigit(next)) return false;
            ++i;  // the sign or digit after the exponent mark is taken as it is
        } else if (c == ' ' || c == '\t') {
            if (digit || sign || point || exponent) return false;
        } else {
            return false;
        }
    }
    return digit;
}

unsigned zkStringBase::skipNextWhite(unsigned pos) const {
    if (pos >= m_length) return pos;
    while (pos < m_length && zkIsBlankOrLineEnd(m_data[pos])) ++pos;
    return pos;
}

void zkStringBase::toLower() {
    zkCaseTables fold;
    for (unsigned i = 0; i < m_length; ++i) m_data[i] = static_cast<char>(fold.lower(m_data[i]));
}

void zkStringBase::toUpper() {
    zkCaseTables fold;
    for (unsigned i = 0; i < m_length; ++i) m_data[i] = static_cast<char>(fold.upper(m_data[i]));
}

void zkStringBase::firstUpper() {
    zkCaseTables fold;
    bool afterSpace = true;
    for (unsigned i = 0; i < m_length; ++i) {
        char c = m_data[i];
        if (afterSpace) m_data[i] = static_cast<char>(fold.upper(c));
        afterSpace = zkIsSpace(c);
    }
}

void zkStringBase::invertCase() {
    zkCaseTables fold;
    for (unsigned i = 0; i < m_length; ++i) {
        char c = m_data[i];
        if (std::islower(static_cast<signed char>(c)))
            m_data[i] = static_cast<char>(fold.upper(c));
        else if (std::isupper(static_cast<signed char>(c)))
            m_data[i] = static_cast<char>(fold.lower(c));
    }
}

zkStringBase& zkStringBase::stripWhite(StripType bits) {
    if (m_length == 0) return *this;
    if (bits & StripLeading) {
        unsigned lead = 0;
        while (lead < m_length && zkIsSpace(m_data[lead])) ++lead;
        if (lead) del(0, lead - 1);
    }
    if (bits & StripTrailing) {
        while (m_length && zkIsSpace(m_data[m_length - 1])) --m_length;
        m_data[m_length] = '\0';
    }
    if (bits & StripAll) {
        // One pass that keeps the other bytes in order.
        unsigned kept = 0;
        for (unsigned i = 0; i < m_length; ++i)
            if (!zkIsSpace(m_data[i])) m_data[kept++] = m_data[i];
        m_length = kept;
        m_data[kept] = '\0';
    }
    return *this;
}
