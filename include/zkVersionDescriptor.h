/// zkVersionDescriptor: a version of major number, minor number and sub-minor
/// character, parsed from text such as "2.1a" and compared.
///
/// The text form is the major number, a full stop, the minor number and,
/// optionally, one character that marks a sub-release. The sub-minor is read at
/// position 2 * n + 1, where n is the length of the text before the first full
/// stop: the character after the minor number when the minor part is as long as
/// the major part. No sub-minor is 0.
///
/// Versions order by major, then minor, then sub-minor; the sub-minor compares
/// as a signed byte, so no sub-minor comes before every letter and digit, and a
/// byte of 0x80 or more before no sub-minor. Two versions are in line when they
/// share major and minor.
///
/// A version is a plain value: it allocates nothing and copies member by member.
/// One object is used by one thread at a time.
#ifndef ZK_VERSION_DESCRIPTOR_H
#define ZK_VERSION_DESCRIPTOR_H

#include "zkExport.h"

class ZK_API zkVersionDescriptor {
public:
    /// Version 0.0 with no sub-minor.
    zkVersionDescriptor();
    /// Version 0.0 with no sub-minor, then SetVersionDescriptor(text).
    explicit zkVersionDescriptor(const char* text);
    zkVersionDescriptor(const zkVersionDescriptor&) = default;
    zkVersionDescriptor& operator=(const zkVersionDescriptor&) = default;
    /// Nothing to free.
    virtual ~zkVersionDescriptor();

    /// Reads text of any length into the three fields and returns 0. The major
    /// number is the text before the first full stop as strtol reads it (blanks
    /// and a sign allowed), clamped to the 32-bit range; the minor number is the
    /// run of digits after the full stop (0 when no digit follows it or there is
    /// no full stop);
    /// the sub-minor is the character at 2 * n + 1 (0 when the text ends
    /// first). A null, empty or full-stop-first text changes nothing.
    int SetVersionDescriptor(const char* text) noexcept;

    /// Whether this version comes before other.
    bool operator<(const zkVersionDescriptor& other) const;
    /// Whether this version comes after other.
    bool operator>(const zkVersionDescriptor& other) const;
    /// Whether major, minor and sub-minor are all equal.
    bool operator==(const zkVersionDescriptor& other) const;
    /// Whether major and minor are equal; the sub-minor is ignored.
    bool IsInline(const zkVersionDescriptor& other) const;

    int GetMajor() const { return m_major; }
    int GetMinor() const { return m_minor; }
    /// The sub-minor character, or 0 when there is none.
    char GetSubMinor() const { return m_subMinor; }

private:
    int m_major;
    int m_minor;
    char m_subMinor;
};

#endif
