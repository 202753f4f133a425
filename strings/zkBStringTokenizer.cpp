#include "zkBStringTokenizer.h"

#include <cstring>

const zkStringBase zkBStringTokenizer::m_spToken(" ");
const zkStringBase zkBStringTokenizer::m_crlfToken("\r\n");
const zkStringBase zkBStringTokenizer::m_csvToken(",");

zkBStringTokenizer::zkBStringTokenizer(const zkStringBase& source, const zkStringBase& separators, bool strip)
    : m_source(source), m_separators(separators), m_position(0), m_strip(strip) {}

bool zkBStringTokenizer::GetNext(zkStringBase& token) {
    if (m_position == zkStringBase::BadIndex || m_source.isNull()) return false;
    // A single separator, the usual case, is found with memchr directly; the
    // field and the next position are those the cutter below gives. A token
    // that is the source or the separator string is emptied first, as below,
    // which ends the walk or leaves no separator.
    if (m_separators.length() == 1 && &token != &m_separators) {
        const unsigned length = &token == &m_source ? 0 : m_source.length();
        if (m_position >= length) {
            token.makeNull();
            m_position = zkStringBase::BadIndex;
        } else {
            const char* data = m_source.data();
            const void* hit = std::memchr(data + m_position, m_separators[0], length - m_position);
            const unsigned end = hit ? static_cast<unsigned>(static_cast<const char*>(hit) - data) : length;
            token.assign(data + m_position, end - m_position);
            m_position = hit ? end + 1 : zkStringBase::BadIndex;
        }
        if (m_strip) token.stripWhite(zkStringBase::StripEnds);
        return true;
    }
    token.makeNull();
    // The cutter copies up to the next separator; a start past the last byte
    // copies nothing and ends the walk, which hands out the empty last token
    // after a trailing separator.
    m_position = m_source.subString(m_separators, token, m_position, zkStringBase::BadIndex, 0);
    if (m_strip) token.stripWhite(zkStringBase::StripEnds);
    if (m_position != zkStringBase::BadIndex) ++m_position;
    return true;
}
