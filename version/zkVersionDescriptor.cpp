#include "zkVersionDescriptor.h"

#include <climits>
#include <cstdlib>
#include <cstring>

namespace {

constexpr char kFullStop = '.';

// strtol's result brought into the 32-bit range, as strtol itself gives it
// where long has 32 bits, so every build reads the same numbers.
int clampToInt(long value) {
    if (value > INT_MAX) return INT_MAX;
    if (value < INT_MIN) return INT_MIN;
    return static_cast<int>(value);
}

bool isDecimalDigit(char c) {
    return c >= '0' && c <= '9';
}

// The sub-minor orders as a signed byte whatever the signedness of char.
signed char subMinorRank(char c) {
    return static_cast<signed char>(c);
}

}  // namespace

zkVersionDescriptor::zkVersionDescriptor() : m_major(0), m_minor(0), m_subMinor(0) {}

zkVersionDescriptor::zkVersionDescriptor(const char* text) : zkVersionDescriptor() {
    SetVersionDescriptor(text);
}

zkVersionDescriptor::~zkVersionDescriptor() = default;

int zkVersionDescriptor::SetVersionDescriptor(const char* text) noexcept {
    if (text == nullptr) return 0;
    const std::size_t majorLength = std::strcspn(text, ".");
    if (majorLength == 0) return 0;
    const std::size_t length = majorLength + std::strlen(text + majorLength);

    // strtol may read the text in place: the major part holds no full stop,
    // and a full stop or the end, where the part ends, is no digit.
    m_major = clampToInt(std::strtol(text, nullptr, 10));

    // Without a full stop the minor part is empty rather than whatever lies
    // past the terminator.
    const char* minorText = text[majorLength] == kFullStop ? text + majorLength + 1 : text + majorLength;
    m_minor = isDecimalDigit(*minorText) ? clampToInt(std::strtol(minorText, nullptr, 10)) : 0;

    // Position 2n + 1 is the sub-minor when the text reaches it. It is read
    // there even when the minor part is longer than the major part, so 1.10a
    // gives the digit 0: the position, not the end of the minor digits, is
    // what the text form fixes.
    const std::size_t subMinorAt = 2 * majorLength + 1;
    m_subMinor = subMinorAt < length ? text[subMinorAt] : '\0';
    return 0;
}

bool zkVersionDescriptor::operator<(const zkVersionDescriptor& other) const {
    if (m_major == other.m_major && m_minor == other.m_minor)
        return subMinorRank(m_subMinor) < subMinorRank(other.m_subMinor);
    if (m_major != other.m_major) return m_major < other.m_major;
    return m_minor < other.m_minor;
}

bool zkVersionDescriptor::operator>(const zkVersionDescriptor& other) const {
    if (m_major == other.m_major && m_minor == other.m_minor)
        return subMinorRank(m_subMinor) > subMinorRank(other.m_subMinor);
    if (m_major != other.m_major) return m_major > other.m_major;
    return m_minor > other.m_minor;
}

bool zkVersionDescriptor::operator==(const zkVersionDescriptor& other) const {
    return m_major == other.m_major && m_minor == other.m_minor && m_subMinor == other.m_subMinor;
}

bool zkVersionDescriptor::IsInline(const zkVersionDescriptor& other) const {
    return m_major == other.m_major && m_minor == other.m_minor;
}
