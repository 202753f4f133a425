// Differential test of zkStringBase: operations decoded from the input run on
// a zkStringBase and on a std::string model of the documented behaviour, and
// every result and every intermediate text must agree.
#include <ctype.h>
#include <string.h>

#include "zkFuzzInput.h"
#include "zkStringBase.h"

namespace {

constexpr unsigned Bad = zkStringBase::BadIndex;
// Keeps the texts small enough that every operation stays cheap.
constexpr size_t kMaxModelLength = 4096;
constexpr unsigned kMaxArgLength = 12;

// Folding as documented: each byte taken as a signed char through the C
// library's toupper/tolower.
int upper(char c) {
    return toupper(static_cast<signed char>(c));
}
int lower(char c) {
    return tolower(static_cast<signed char>(c));
}
bool isSpace(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}
bool same(char a, char b, bool exact) {
    return exact ? a == b : upper(a) == upper(b);
}

// A const char* argument: n == 0 measures the text up to its first zero byte.
std::string measured(const std::string& s, unsigned n) {
    return n == 0 ? std::string(s.c_str()) : s.substr(0, n);
}

unsigned find(const std::string& m, const std::string& p, unsigned start, bool exact) {
    if (start >= m.size() || p.empty() || m.size() - start < p.size()) return Bad;
    for (size_t i = start; i + p.size() <= m.size(); ++i) {
        size_t k = 0;
        while (k < p.size() && same(m[i + k], p[k], exact)) ++k;
        if (k == p.size()) return static_cast<unsigned>(i);
    }
    return Bad;
}

unsigned rfind(const std::string& m, const std::string& p, unsigned start, bool exact) {
    if (start == Bad) start = static_cast<unsigned>(m.size()) - 1;
    if (start >= m.size() || p.empty() || p.size() > m.size()) return Bad;
    for (size_t i = std::min<size_t>(start, m.size() - p.size()) + 1; i-- > 0;) {
        size_t k = 0;
        while (k < p.size() && same(m[i + k], p[k], exact)) ++k;
        if (k == p.size()) return static_cast<unsigned>(i);
    }
    return Bad;
}

void insert(std::string& m, const std::string& s, unsigned pos) {
    m.insert(std::min<size_t>(pos, m.size()), s);
}

void del(std::string& m, unsigned from, unsigned to) {
    if (m.empty()) return;
    if (to >= m.size()) to = static_cast<unsigned>(m.size()) - 1;
    if (from > to) return;
    m.erase(from, to - from + 1);
}

int compare(const std::string& a, const std::string& b, bool exact) {
    size_t n = std::min(a.size(), b.size());
    for (size_t i = 0; i < n; ++i) {
        if (exact && a[i] != b[i]) return static_cast<unsigned char>(a[i]) < static_cast<unsigned char>(b[i]) ? -1 : 1;
        if (!exact && upper(a[i]) != upper(b[i])) return upper(a[i]) - upper(b[i]);
    }
    return a.size() < b.size() ? -1 : a.size() > b.size() ? 1 : 0;
}

std::string text(const zkStringBase& s) {
    return std::string(s.data(), s.length());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    zkFuzzInput in(data, size);
    zkStringBase z;
    std::string m;
    auto position = [&]() -> unsigned {
        uint8_t b = in.byte();
        return b == 0xFF ? Bad : b % (m.size() + 3);
    };

    while (!in.done()) {
        const uint8_t op = in.byte();
        const std::string arg = in.text(kMaxArgLength);
        const unsigned n = in.byte() % 4 == 0 ? 0 : static_cast<unsigned>(arg.size());
        const bool exact = op & 0x80;
        const zkStringBase zarg(arg.data(), static_cast<unsigned>(arg.size()));
        if (m.size() > kMaxModelLength) {
            z.cut(z.length() / 2);
            m.resize(m.size() - m.size() / 2);
        }
        switch (op % 22) {
        case 0:
            z.append(arg.c_str(), n);
            m += measured(arg, n);
            break;
        case 1:
            z.append(arg.empty() ? '\0' : arg[0]);
            m += arg.empty() ? '\0' : arg[0];
            break;
        case 2:
            z.prepend(arg.c_str(), n);
            m.insert(0, measured(arg, n));
            break;
        case 3: {
            unsigned pos = position();
            z.insert(arg.c_str(), pos, n);
            insert(m, measured(arg, n), pos);
            break;
        }
        case 4: {
            unsigned from = position(), to = position();
            z.del(from, to);
            del(m, from, to);
            break;
        }
        case 5: {
            unsigned k = position();
            z.cut(k);
            m.resize(k >= m.size() ? 0 : m.size() - k);
            break;
        }
        case 6: {
            const std::string with = in.text(kMaxArgLength);
            const bool none = in.byte() & 1;
            unsigned start = position();
            z.replace(arg.c_str(), none ? nullptr : with.c_str(), start, exact);
            const std::string what(arg.c_str());
            unsigned at = find(m, what, start, exact);
            if (at != Bad) m.replace(at, what.size(), none ? std::string() : std::string(with.c_str()));
            break;
        }
        case 7: {
            unsigned from = position(), to = position();
            z.replace(zarg, from, to);
            del(m, from, to);
            insert(m, arg, from);
            break;
        }
        case 8: {
            unsigned from = position(), to = position();
            zkStringBase piece = z.subString(from, to);
            std::string want;
            if (from < m.size()) {
                unsigned last = to >= m.size() ? static_cast<unsigned>(m.size()) - 1 : to;
                if (from <= last) want = m.substr(from, last - from + 1);
            }
            ZK_FUZZ_CHECK(text(piece) == want && piece.getCompareType() == zkStringBase::CaseSensitive);
            break;
        }
        case 9: {
            // The field cutters, with one separator byte or a set of them.
            unsigned from = position(), to = position();
            const bool clear = in.byte() & 1, single = op & 0x40;
            std::string seps = single ? arg.substr(0, 1) : arg;
            if (single && seps.empty()) seps = ",";
            zkStringBase out(zarg);
            unsigned got = single ? z.subString(seps[0], out, from, to, clear)
                                  : z.subString(zkStringBase(seps.data(), static_cast<unsigned>(seps.size())), out,
                                                from, to, clear);
            std::string want = arg;
            unsigned at = Bad;
            unsigned last = to >= m.size() ? static_cast<unsigned>(m.size()) - 1 : to;
            if (from != Bad && from <= last && !m.empty()) {
                for (unsigned i = from; i <= last; ++i) {
                    if (seps.find(m[i]) != std::string::npos) {
                        at = i;
                        break;
                    }
                    want += m[i];
                }
            }
            if (at == Bad && clear) want.clear();
            ZK_FUZZ_CHECK(got == at && text(out) == want);
            break;
        }
        case 10: {
            unsigned start = position();
            ZK_FUZZ_CHECK(z.find(arg.c_str(), start, n, exact) == find(m, measured(arg, n), start, exact));
            ZK_FUZZ_CHECK(z.find(zarg, start, exact) == find(m, arg, start, exact));
            break;
        }
        case 11: {
            unsigned start = position();
            ZK_FUZZ_CHECK(z.rfind(arg.c_str(), start, n, exact) == rfind(m, measured(arg, n), start, exact));
            ZK_FUZZ_CHECK(z.rfind(zarg, start, exact) == rfind(m, arg, start, exact));
            break;
        }
        case 12: {
            char ch = arg.empty() ? 'a' : arg[0];
            unsigned start = position();
            ZK_FUZZ_CHECK(z.find(ch, start, exact) == find(m, std::string(1, ch), start, exact));
            ZK_FUZZ_CHECK(z.rfind(ch, start, exact) == rfind(m, std::string(1, ch), start, exact));
            break;
        }
        case 13: {
            unsigned start = position(), want = Bad;
            for (size_t i = start; i < m.size() && want == Bad; ++i)
                for (char c : arg)
                    if (same(m[i], c, exact)) want = static_cast<unsigned>(i);
            ZK_FUZZ_CHECK(z.findFirstOf(zarg, start, exact) == want);
            break;
        }
        case 14: {
            const zkStringBase::StripType bits = static_cast<zkStringBase::StripType>(
                (in.byte() & 1 ? 0x001 : 0) | (in.byte() & 1 ? 0x010 : 0) | (in.byte() & 1 ? 0x100 : 0));
            z.stripWhite(bits);
            size_t b = 0, e = m.size();
            if (bits & 0x001)
                while (b < e && isSpace(m[b])) ++b;
            if (bits & 0x010)
                while (e > b && isSpace(m[e - 1])) --e;
            m = m.substr(b, e - b);
            if (bits & 0x100) {
                std::string kept;
                for (char c : m)
                    if (!isSpace(c)) kept += c;
                m = kept;
            }
            break;
        }
        case 15:
            z.toUpper();
            for (char& c : m) c = static_cast<char>(upper(c));
            break;
        case 16:
            z.toLower();
            for (char& c : m) c = static_cast<char>(lower(c));
            break;
        case 17:
            z.invertCase();
            for (char& c : m) c = static_cast<char>(c >= 'a' && c <= 'z' ? upper(c) : lower(c));
            break;
        case 18:
            z.firstUpper();
            for (size_t i = 0; i < m.size(); ++i)
                if (i == 0 || isSpace(m[i - 1])) m[i] = static_cast<char>(upper(m[i]));
            break;
        case 19: {
            const int want = compare(m, arg, exact);
            ZK_FUZZ_CHECK(z.compareTo(zarg, exact) == want);
            ZK_FUZZ_CHECK(z.equals(zarg, exact) == (want == 0));
            ZK_FUZZ_CHECK(z.lessThan(zarg, exact) == (want < 0) && z.greaterThan(zarg, exact) == (want > 0));
            break;
        }
        case 20: {
            unsigned from = position(), to = position();
            z.appendSubString(zarg, from, to);
            if (from < arg.size()) {
                unsigned last = to >= arg.size() ? static_cast<unsigned>(arg.size()) - 1 : to;
                if (from <= last) m += arg.substr(from, last - from + 1);
            }
            break;
        }
        default:
            // The string's own text as the argument.
            if (op & 1) {
                z.append(z);
                m += m;
            } else {
                unsigned pos = position();
                z.insert(z, pos);
                insert(m, std::string(m), pos);
            }
            break;
        }
        ZK_FUZZ_CHECK(z.data()[z.length()] == '\0' && z.capacity() > z.length());
        ZK_FUZZ_CHECK(text(z) == m);
    }
    return 0;
}
