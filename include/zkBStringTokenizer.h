/// zkBStringTokenizer: hands out, one call at a time, the pieces of a string
/// that lie between separator bytes.
///
/// The tokenizer keeps references to the source and to the separator set; it
/// copies neither, so both must outlive it, and a change to either between
/// calls takes effect at the next call. Every byte of the separator set is a
/// separator by itself, compared exactly; there is no quoting. A source with k
/// separator bytes yields exactly k + 1 tokens; an empty source yields none.
/// There is no reset: a new tokenizer starts again from the beginning.
///
/// One object is used by one thread at a time. The three shared separator sets
/// are read-only.
#ifndef ZK_BSTRING_TOKENIZER_H
#define ZK_BSTRING_TOKENIZER_H

#include "zkExport.h"
#include "zkStringBase.h"

class ZK_API zkBStringTokenizer {
public:
    /// The space.
    static const zkStringBase m_spToken;
    /// Carriage return and line feed, each a separator by itself.
    static const zkStringBase m_crlfToken;
    /// The comma.
    static const zkStringBase m_csvToken;

    /// Splits `source` at the bytes of `separators`; with `strip`, each token
    /// is stripped of whitespace at both ends.
    zkBStringTokenizer(const zkStringBase& source, const zkStringBase& separators, bool strip);

    /// Replaces `token` with the next token and returns true; returns false and
    /// leaves `token` alone when none is left.
    bool GetNext(zkStringBase& token);

private:
    const zkStringBase& m_source;
    const zkStringBase& m_separators;
    unsigned m_position;
    bool m_strip;
};

#endif
