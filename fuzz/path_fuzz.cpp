// Path joining and separator translation on arbitrary directory and name pairs.
#include <string.h>

#include "zkFileManager.h"
#include "zkFuzzInput.h"

namespace {

bool hasBackslash(const zkStringBase& s) {
    return memchr(s.data(), '\\', s.length()) != nullptr;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    zkFuzzInput in(data, size);
    std::string d = in.text(200), n = in.text(200), f = in.rest();
    zkStringBase dir(d.data(), static_cast<unsigned>(d.size()));
    zkStringBase name(n.data(), static_cast<unsigned>(n.size()));
    zkStringBase file(f.data(), static_cast<unsigned>(f.size()));

    zkStringBase bare, trailing, joined;
    zkFileManager::MakePath(bare, dir, name, 1);
    zkFileManager::MakePath(trailing, dir, name, 0);
    zkFileManager::MakePath(joined, dir, name, file);
    ZK_FUZZ_CHECK(!bare.isNull() && !hasBackslash(bare));
    // The two forms differ by the one trailing separator that the first
    // removes; the root stays, whatever separators led to it.
    zkStringBase withSlash(bare);
    withSlash.append('/');
    ZK_FUZZ_CHECK(!hasBackslash(trailing));
    if (bare.equals("/"))
        ZK_FUZZ_CHECK(trailing.length() <= 2 && trailing[0] == '/' && trailing.getLast() == '/');
    else
        ZK_FUZZ_CHECK(trailing.equals(withSlash));
    ZK_FUZZ_CHECK(joined.length() >= trailing.length() &&
                  memcmp(joined.data(), trailing.data(), trailing.length()) == 0);

    zkStringBase translated(file);
    zkFileManager::TranslatePathSeparators(translated, 0);
    ZK_FUZZ_CHECK(translated.length() == file.length());
    for (unsigned i = 0; i < file.length(); ++i) ZK_FUZZ_CHECK(translated[i] == (file[i] == '\\' ? '/' : file[i]));
    return 0;
}
