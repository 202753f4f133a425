// Tokens joined with the separators between them give back the source, and
// k separator bytes give k + 1 tokens; stripped tokens are the same pieces
// without whitespace at their ends.
#include <ctype.h>
#include <string.h>

#include <vector>

#include "zkBStringTokenizer.h"
#include "zkFuzzInput.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    zkFuzzInput in(data, size);
    bool strip = in.byte() & 1;
    std::string s = in.text(8), t = in.rest();
    const zkStringBase seps(s.data(), static_cast<unsigned>(s.size()));
    const zkStringBase source(t.data(), static_cast<unsigned>(t.size()));

    std::vector<std::string> pieces(1);
    for (char c : t) {
        if (memchr(s.data(), c, s.size()))
            pieces.emplace_back();
        else
            pieces.back() += c;
    }
    if (t.empty()) pieces.clear();

    zkBStringTokenizer tokenizer(source, seps, strip);
    zkStringBase token;
    std::string joined;
    size_t count = 0;
    while (tokenizer.GetNext(token)) {
        ZK_FUZZ_CHECK(count < pieces.size());
        std::string got(token.data(), token.length()), want = pieces[count++];
        if (strip) {
            size_t b = 0, e = want.size();
            while (b < e && isspace(static_cast<unsigned char>(want[b]))) ++b;
            while (e > b && isspace(static_cast<unsigned char>(want[e - 1]))) --e;
            want = want.substr(b, e - b);
        } else {
            joined += got;
            if (joined.size() < t.size()) {
                ZK_FUZZ_CHECK(memchr(s.data(), t[joined.size()], s.size()) != nullptr);
                joined += t[joined.size()];
            }
        }
        ZK_FUZZ_CHECK(got == want);
    }
    ZK_FUZZ_CHECK(count == pieces.size());
    if (!strip) ZK_FUZZ_CHECK(joined == t);
    ZK_FUZZ_CHECK(!tokenizer.GetNext(token));
    return 0;
}
