#include "zkBStringTokenizer.h"

#include <cstring>

const zkStringBase zkBStringTokenizer::m_spToken(" ");
const zkStringBase zkBStringTokenizer::m_crlfToken("\r\n");
const zkStringBase zkBStringTokenizer::m_csvToken(",");

zkBStringTokenizer::zkBStringTokenizer(const zkStringBase& source, const zkStringBase& separators, bool strip)
    : m_source(source), m_separators(separators), m_position(0), m_strip(strip) {}

bool zkBStringTokenizer::GetNext(zkStringBase& token) {
    if (m_position == zkStringBase::BadIndex || m_source.isNull()) return false;
    // makeNull, without the call.
    token.m_length = 0;
    token.m_data[0] = '\0';
    // A single separator, the usual case, is found with memchr directly, and
    // a token that fits is copied in place as append would copy it; the
    // field and the next position are those the cutter below gives. The
    // lengths are read after emptying token, which may be one of the two:
    // then the source is empty and nothing is copied from it.
    const unsigned length = m_source.length();
    if (m_separators.length() == 1) {
        if (m_position >= length) {
            m_position = zkStringBase::BadIndex;
        } else {
            const char* data = m_source.data();
            const void* hit = std::memchr(data + m_position, m_separators[0], length - m_position);
            const unsigned end = hit ? static_cast<unsigned>(static_cast<const char*>(hit) - data) : length;
            const unsigned n = end - m_position;
            if (n != 0 && n < token.m_capacity) {
                token.m_data[n] = '\0';
                std::memcpy(token.m_data, data + m_position, n);
                token.m_length = n;
            } else if (n != 0) {
                token.append(data + m_position, n);
            }
            m_position = hit ? end + 1 : zkStringBase::BadIndex;
        }
        if (m_strip) token.stripWhite(zkStringBase::StripEnds);
        return true;
    }
    // The cutter copies up to the next separator; a start past the last byte
    // copies nothing and ends the walk, which hands out the empty last token
    // after a trailing separator.
    m_position = m_source.subString(m_separators, token, m_position, zkStringBase::BadIndex, 0);
    if (m_strip) token.stripWhite(zkStringBase::StripEnds);
    if (m_position != zkStringBase::BadIndex) ++m_position;
    return true;
}
