// Loads arbitrary bytes as an INI file, saves the document and loads it
// again: the second document equals the first whenever the first stays
// within what the written form can carry. A document the writer must refuse
// (a line break inside a value) gives 1 and leaves the file alone.
#include <stdlib.h>
#include <string.h>
#include <unistd.h>

#include <vector>

#include "zkFuzzInput.h"
#include "zkMappedINIFile.h"

namespace {

struct Line {
    int comment;
    std::string key, value;
    bool operator==(const Line& o) const { return comment == o.comment && key == o.key && value == o.value; }
};
struct Section {
    std::string name;
    std::vector<Line> lines;
    bool operator==(const Section& o) const { return name == o.name && lines == o.lines; }
};

std::string str(const zkStringBase& s) {
    return std::string(s.data(), s.length());
}

std::vector<Section> snapshot(zkMappedINIFile& ini) {
    std::vector<Section> doc;
    for (const INISection* section : *ini.GetSectionList()) {
        doc.push_back({str(section->m_name), {}});
        for (const INILine* line : *section->m_lines)
            doc.back().lines.push_back({line->m_isComment, str(line->m_key), str(line->m_value)});
    }
    return doc;
}

// What a written key line can carry: a key that holds no "=" and does not
// begin with a character that would make the line a header or a comment.
bool writable(const std::vector<Section>& doc) {
    for (const Section& section : doc)
        for (const Line& line : section.lines) {
            if (line.comment) continue;
            if (line.key.find('=') != std::string::npos) return false;
            if (!line.key.empty() && (line.key[0] == '[' || line.key[0] == ';' || line.key[0] == '#')) return false;
        }
    return true;
}

std::string readFile(const std::string& path) {
    std::string bytes;
    if (FILE* f = fopen(path.c_str(), "rb")) {
        char buffer[4096];
        size_t n;
        while ((n = fread(buffer, 1, sizeof buffer, f)) > 0) bytes.append(buffer, n);
        fclose(f);
    }
    return bytes;
}

void writeFile(const std::string& path, const std::string& bytes) {
    FILE* f = fopen(path.c_str(), "wb");
    ZK_FUZZ_CHECK(f != nullptr);
    ZK_FUZZ_CHECK(fwrite(bytes.data(), 1, bytes.size(), f) == bytes.size());
    fclose(f);
}

const std::string& workFile() {
    static std::string path;
    if (path.empty()) {
        // Every save is flushed to disk; on a memory file system that costs nothing.
        char pattern[] = "/dev/shm/zkutil-ini-fuzz-XXXXXX";
        if (access("/dev/shm", W_OK) != 0) memcpy(pattern, "/tmp/", 5);
        ZK_FUZZ_CHECK(mkdtemp(pattern) != nullptr);
        path = std::string(pattern) + "/f.ini";
        static std::string dir = pattern;
        atexit([] {
            unlink(path.c_str());
            rmdir(dir.c_str());
        });
    }
    return path;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string& path = workFile();
    const std::string bytes(reinterpret_cast<const char*>(data), size);
    writeFile(path, bytes);

    zkMappedINIFile ini(path.c_str());
    ZK_FUZZ_CHECK(ini.Open(0) == 0);
    const std::vector<Section> first = snapshot(ini);

    // A value with a line break would read back as lines of its own.
    if (!bytes.empty() && (bytes.back() & 1)) {
        zkMappedINIFile refused(path.c_str());
        ZK_FUZZ_CHECK(refused.Open(0) == 0);
        refused.SetVal("broken", "key", "a\nb");
        ZK_FUZZ_CHECK(refused.Close(1) == 1);
        ZK_FUZZ_CHECK(readFile(path) == bytes);
        ZK_FUZZ_CHECK(refused.GetVal("broken", "key").equals("a\nb"));
    }

    ZK_FUZZ_CHECK(ini.Close(1) == 0);
    ZK_FUZZ_CHECK(ini.GetSectionList()->empty());
    ZK_FUZZ_CHECK(ini.Open(0) == 0);
    if (writable(first)) ZK_FUZZ_CHECK(snapshot(ini) == first);
    ini.Clear();
    return 0;
}
