#include "zkBStringTokenizer.h"

const zkStringBase zkBStringTokenizer::m_spToken(" ");
const zkStringBase zkBStringTokenizer::m_crlfToken("\r\n");
const zkStringBase zkBStringTokenizer::m_csvToken(",");

zkBStringTokenizer::zkBStringTokenizer(const zkStringBase& source, const zkStringBase& separators, bool strip)
    : m_source(source), m_separators(separators), m_position(0), m_strip(strip) {}

bool zkBStringTokenizer::GetNext(zkStringBase& token) {
    if (m_position == zkStringBase::BadIndex || m_source.isNull()) return false;
    token.makeNull();
    // The cutter copies up to the next separator; a start past the last byte
    // copies nothing and ends the walk, which hands out the empty last token
    // after a trailing separator.
    m_position = m_source.subString(m_separators, token, m_position, zkStringBase::BadIndex, 0);
    if (m_strip) token.stripWhite(zkStringBase::StripEnds);
    if (m_position != zkStringBase::BadIndex) ++m_position;
    return true;
}
