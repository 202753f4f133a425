// Shared by the INI benchmark programs: one generated 8 MiB INI text, the
// same in every run, and the last key it holds.
#ifndef ZK_INI_BENCH_FILE_H
#define ZK_INI_BENCH_FILE_H

#include <string>

#include "zkBenchPairs.h"

namespace zkbench {

constexpr unsigned kINISections = 2000;
constexpr unsigned kINIKeysPerSection = 50;

// The generated text and the last section, key and value written into it.
struct INIBenchFile {
    std::string text, lastSection, lastKey, lastValue;
};

inline std::string word(Random& random, unsigned length) {
    std::string w;
    for (unsigned i = 0; i < length; ++i) w += static_cast<char>('a' + random.below(26));
    return w;
}

// kINISections sections of kINIKeysPerSection "key = value" lines, a comment
// line before every tenth key, an empty line after each section.
inline INIBenchFile makeINIBenchFile() {
    constexpr unsigned kCommentEvery = 10;
    constexpr unsigned kMinValueLength = 30;
    constexpr unsigned kValueLengthRange = 64;
    constexpr unsigned long long kSeed = 1234567;
    Random random(kSeed);
    INIBenchFile file;
    file.text = "; generated for the INI benchmark\n\n";
    for (unsigned s = 0; s < kINISections; ++s) {
        std::string section = "section" + std::to_string(s) + word(random, 4);
        file.text += "[" + section + "]\n";
        for (unsigned k = 0; k < kINIKeysPerSection; ++k) {
            if (k % kCommentEvery == 0) file.text += "; " + word(random, 10) + " " + word(random, 20) + "\n";
            std::string key = "key" + std::to_string(k) + "_" + word(random, 6);
            std::string value;
            unsigned length = kMinValueLength + random.below(kValueLengthRange);
            while (value.size() < length) value += (value.empty() ? "" : " ") + word(random, 1 + random.below(9));
            file.text += key + " = " + value + "\n";
            file.lastSection = section;
            file.lastKey = key;
            file.lastValue = value;
        }
        file.text += "\n";
    }
    return file;
}

}  // namespace zkbench

#endif
