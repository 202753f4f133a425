#include "formats.h"

#include <list>
#include <utility>

namespace {

using Pairs = std::list<std::pair<zkStringBase, zkStringBase> >;

bool isShellName(const zkStringBase& name) {
    if (name.isNull()) return false;
    for (unsigned i = 0; i < name.length(); ++i) {
        const char c = name[i];
        const bool letter = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_';
        if (!letter && !(i > 0 && c >= '0' && c <= '9')) return false;
    }
    return true;
}

// Single quotes keep every byte but the quote itself, which is closed,
// escaped and reopened.
void appendShellQuoted(zkStringBase& out, const zkStringBase& text) {
    out.append('\'');
    for (unsigned i = 0; i < text.length(); ++i) {
        if (text[i] == '\'')
            out.append("'\\''");
        else
            out.append(text[i]);
    }
    out.append('\'');
}

// The length of the UTF-8 sequence at text[i], or 0 when it is not one
// (overlong forms, surrogates and code points past U+10FFFF included).
unsigned utf8Length(const zkStringBase& text, unsigned i) {
    const unsigned char c = static_cast<unsigned char>(text[i]);
    if (c < 0x80) return 1;
    unsigned n;
    unsigned char low = 0x80, high = 0xBF;  // the range of the second byte
    if (c >= 0xC2 && c <= 0xDF) {
        n = 2;
    } else if (c >= 0xE0 && c <= 0xEF) {
        n = 3;
        if (c == 0xE0) low = 0xA0;
        if (c == 0xED) high = 0x9F;
    } else if (c >= 0xF0 && c <= 0xF4) {
        n = 4;
        if (c == 0xF0) low = 0x90;
        if (c == 0xF4) high = 0x8F;
    } else {
        return 0;
    }
    if (i + n > text.length()) return 0;
    for (unsigned k = 1; k < n; ++k) {
        const unsigned char b = static_cast<unsigned char>(text[i + k]);
        if (b < (k == 1 ? low : 0x80) || b > (k == 1 ? high : 0xBF)) return 0;
    }
    return n;
}

bool appendJsonString(zkStringBase& out, const zkStringBase& text, zkStringBase& error) {
    static const char kHex[] = "0123456789abcdef";
    out.append('"');
    for (unsigned i = 0; i < text.length();) {
        const char c = text[i];
        const unsigned n = utf8Length(text, i);
        if (n == 0) {
            error = "'";
            error.append(text).append("' is not UTF-8 text, which JSON cannot carry; use -format:sh");
            return false;
        }
        const char* shortEscape = c == '"' ? "\\\"" : c == '\\' ? "\\\\" : c == '\t' ? "\\t" : nullptr;
        if (shortEscape) {
            out.append(shortEscape);
        } else if (static_cast<unsigned char>(c) < 0x20) {
            out.append("\\u00").append(kHex[(c >> 4) & 0xF]).append(kHex[c & 0xF]);
        } else {
            out.append(text.data() + i, n);
        }
        i += n;
    }
    out.append('"');
    return true;
}

// Drops every pair whose key matched an earlier one, as the reading rules
// find only the first.
void keepFirst(Pairs& pairs) {
    for (auto it = pairs.begin(); it != pairs.end(); ++it)
        for (auto later = std::next(it); later != pairs.end();)
            later = later->first.equals(it->first, false) ? pairs.erase(later) : std::next(later);
}

bool appendJsonObject(zkStringBase& out, const Pairs& pairs, zkStringBase& error) {
    out.append('{');
    bool first = true;
    for (const auto& pair : pairs) {
        if (!first) out.append(", ");
        first = false;
        if (!appendJsonString(out, pair.first, error)) return false;
        out.append(": ");
        if (!appendJsonString(out, pair.second, error)) return false;
    }
    out.append('}');
    return true;
}

bool appendShellAssignments(zkStringBase& out, const Pairs& pairs, zkStringBase& error) {
    for (const auto& pair : pairs) {
        if (!isShellName(pair.first)) {
            error = "'";
            error.append(pair.first).append("' is not a shell name");
            return false;
        }
        out.append(pair.first).append('=');
        appendShellQuoted(out, pair.second);
        out.append('\n');
    }
    return true;
}

// The sections to list: the empty name only when its lines hold keys; sh and
// json take each name once.
std::list<zkStringBase> listedSections(Format format, const zkINIEditor& editor) {
    std::list<zkStringBase> names;
    editor.GetSectionNames(names);
    for (auto it = names.begin(); it != names.end();) {
        Pairs pairs;
        const bool emptyLead = it->isNull() && (editor.GetKeyValues(*it, pairs), pairs.empty());
        bool repeated = false;
        if (format != Format::Lines)
            for (auto earlier = names.begin(); earlier != it && !repeated; ++earlier)
                repeated = earlier->equals(*it, false);
        it = emptyLead || repeated ? names.erase(it) : std::next(it);
    }
    return names;
}

}  // namespace

Format FormatNamed(const zkStringBase& text) {
    if (text == "sh") return Format::Sh;
    if (text == "json") return Format::Json;
    return Format::Lines;
}

bool FormatValue(Format format, const zkStringBase& key, const zkStringBase& value, zkStringBase& out,
                 zkStringBase& error) {
    if (format == Format::Lines) {
        out.append(value).append('\n');
        return true;
    }
    Pairs pairs{{key, value}};
    if (format == Format::Sh) return appendShellAssignments(out, pairs, error);
    if (!appendJsonObject(out, pairs, error)) return false;
    out.append('\n');
    return true;
}

bool FormatSection(Format format, const zkINIEditor& editor, const zkStringBase& section, zkStringBase& out,
                   zkStringBase& error) {
    Pairs pairs;
    editor.GetKeyValues(section, pairs);
    if (format == Format::Lines) {
        for (const auto& pair : pairs) out.append(pair.first).append('=').append(pair.second).append('\n');
        return true;
    }
    keepFirst(pairs);
    if (format == Format::Sh) return appendShellAssignments(out, pairs, error);
    if (!appendJsonObject(out, pairs, error)) return false;
    out.append('\n');
    return true;
}

bool FormatSectionNames(Format format, const zkINIEditor& editor, zkStringBase& out, zkStringBase& error) {
    const std::list<zkStringBase> names = listedSections(format, editor);
    if (format == Format::Lines) {
        for (const zkStringBase& name : names) out.append(name).append('\n');
        return true;
    }
    if (format == Format::Sh) {
        bool first = true;
        for (const zkStringBase& name : names) {
            if (!first) out.append(' ');
            first = false;
            appendShellQuoted(out, name);
        }
        out.append('\n');
        return true;
    }
    out.append('{');
    bool first = true;
    for (const zkStringBase& name : names) {
        if (!first) out.append(", ");
        first = false;
        Pairs pairs;
        editor.GetKeyValues(name, pairs);
        keepFirst(pairs);
        if (!appendJsonString(out, name, error)) return false;
        out.append(": ");
        if (!appendJsonObject(out, pairs, error)) return false;
    }
    out.append("}\n");
    return true;
}
