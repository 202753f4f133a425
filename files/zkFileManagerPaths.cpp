#include "zkFileManager.h"

char zkFileManager::m_slash = '/';

namespace {

bool isSeparator(char ch) {
    return ch == '/' || ch == '\\';
}

// Removes the last component of a path that ends with a separator, keeping
// the separator in front of it. A path with nothing left above that
// component becomes the root, and the root stays the root.
void climb(zkStringBase& path) {
    unsigned end = path.length() - 1;
    while (end > 0 && isSeparator(path[end])) --end;
    while (end > 0 && !isSeparator(path[end])) --end;
    if (isSeparator(path[end])) {
        path.cut(path.length() - end - 1);
    } else {
        path = zkFileManager::m_slash;
    }
}

// Length of the component of name that starts at pos.
unsigned componentLength(const zkStringBase& name, unsigned pos) {
    unsigned end = pos;
    while (end < name.length() && !isSeparator(name[end])) ++end;
    return end - pos;
}

// Reads the leading "." and ".." components of name, moving up for each
// "..", and appends whatever follows them unchanged; a component such as
// "..x" or ".hidden" ends the walk and is appended with the rest.
void walk(zkStringBase& result, const zkStringBase& name) {
    unsigned pos = 0;
    while (pos < name.length()) {
        unsigned n = componentLength(name, pos);
        bool up = n == 2 && name[pos] == '.' && name[pos + 1] == '.';
        bool here = n == 1 && name[pos] == '.';
        if (!up && !here) break;
        if (up) climb(result);
        pos += n;
        while (pos < name.length() && isSeparator(name[pos])) ++pos;
    }
    if (pos < name.length()) result.append(name.data() + pos, name.length() - pos);
}

}  // namespace

void zkFileManager::MakePath(zkStringBase& result, const zkStringBase& dir, const zkStringBase& name,
                             unsigned noTrailing) {
    // The result is built in place, so a name that is the result itself is
    // read from a copy.
    if (&result == &name) {
        const zkStringBase copy(name);
        MakePath(result, dir, copy, noTrailing);
        return;
    }
    result = dir;
    if (result.isNull()) {
        result = m_slash;
    } else if (!isSeparator(result.getLast())) {
        result.append(m_slash);
    }

    unsigned n = name.length();
    if (n == 0 || (n == 1 && name[0] == '.')) {
        // Nothing to add: the directory itself.
    } else if (name[0] != '.') {
        unsigned skip = isSeparator(name[0]) ? 1 : 0;
        result.append(name.data() + skip, n - skip);
    } else if (isSeparator(name[1])) {
        result.append(name.data() + 2, n - 2);
    } else if (name[1] != '.') {
        result.append(name);
    } else {
        walk(result, name);
    }

    // A lone separator is the root and stays, whichever form was asked for.
    if (noTrailing) {
        if (result.length() > 1 && isSeparator(result.getLast())) result.cut(1);
    } else if (result.isNull() || !isSeparator(result.getLast())) {
        result.append(m_slash);
    }
    TranslatePathSeparators(result, 1);
}

void zkFileManager::MakePath(zkStringBase& result, const zkStringBase& dir, const zkStringBase& subdir,
                             const zkStringBase& file) {
    if (&result == &file) {
        const zkStringBase copy(file);
        MakePath(result, dir, subdir, copy);
        return;
    }
    MakePath(result, dir, subdir, 0u);
    if (file.isNull()) return;
    unsigned skip = isSeparator(file[0]) ? 1 : 0;
    result.append(file.data() + skip, file.length() - skip);
}

void zkFileManager::TranslatePathSeparators(zkStringBase& path, unsigned useSlash) {
    char replacement = useSlash ? m_slash : '/';
    unsigned n = path.length();
    for (unsigned i = 0; i < n; ++i) {
        if (path[i] == '\\') path[i] = replacement;
    }
}

int zkFileManager::GetFileInfo(const char* name, zkFileInfo& info) {
    if (name == nullptr || *name == '\0') return 1;
    zkFilename file(name);
    return info.fill(file) ? 0 : 1;
}
