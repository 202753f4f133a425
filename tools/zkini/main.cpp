// zkini: reads and changes INI files from the command line.
//
// The changes (-set, -delete, -merge:, -batch:) go through the line-keeping
// editor, which keeps every byte it does not change and holds the file's lock
// from reading to saving, so concurrent runs serialise; -get and -list read
// through it. -normalize and -firewall rewrite the whole file through the
// document model, holding the same lock. See usage() for the switches and the
// exit statuses.
#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <initializer_list>
#include <vector>

#include "arguments.h"
#include "batch.h"
#include "formats.h"
#include "io.h"
#include "zkINIEditor.h"
#include "zkLogFile.h"
#include "zkMappedINIFile.h"
#include "zkStringBase.h"
#include "zkutilVersion.h"

namespace {

enum ExitStatus { Done = 0, Missing = 1, Usage = 2, FileFailure = 3 };

const char kUsage[] =
    "usage: zkini -file:PATH ACTION [SWITCHES]\n"
    "actions:\n"
    "  -get -section:S -key:K           print the value of K in S\n"
    "  -set -section:S -key:K -value:V  set K in S to V (both made when missing)\n"
    "  -delete -section:S [-key:K]      remove K from S, or the whole section S\n"
    "  -list [-section:S]               list the sections, or the keys of S\n"
    "  -merge:OTHER                     set every key of OTHER in the file\n"
    "  -batch:CHANGES                   apply a file of changes in one save, one\n"
    "                                   per line: set\\tS\\tK\\tV, delete\\tS\\tK, delete\\tS\n"
    "  -normalize                       rewrite the file in normal form\n"
    "  -firewall                        rewrite the file in firewall form\n"
    "  -version, --version              print the version\n"
    "  -help, --help, -h                print this text\n"
    "switches:\n"
    "  -file:PATH     the INI file; - reads standard input and writes changes to\n"
    "                 standard output\n"
    "  -out:PATH      write the changed file there (- for standard output)\n"
    "  -format:F      output of -get and -list: lines (default), sh or json\n"
    "  -existing      -set changes only a key that exists; -delete and -batch:\n"
    "                 fail on a key or section that does not\n"
    "  -quiet         no message when a section or key does not exist\n"
    "  -log:PATH      append a line per saved change to PATH\n"
    "-section: with an empty value names the lines before the first section.\n"
    "Switches are spelled in full; -merge:, -batch: and -file: read - as\n"
    "standard input.\n"
    "exit status: 0 done; 1 no such section or key; 2 bad usage or text that\n"
    "cannot be written; 3 a file that cannot be read, locked or saved, or output\n"
    "that cannot be written\n";

zkStringBase joined(std::initializer_list<const char*> parts) {
    zkStringBase text;
    for (const char* part : parts) text.append(part);
    return text;
}

zkStringBase number(unsigned long n) {
    zkStringBase text;
    text.append(static_cast<long>(n));
    return text;
}

// The path as messages name it.
const char* shown(const zkStringBase& path) {
    return IsStdStream(path) ? "standard input" : path.data();
}

int fileError(const char* doing, const char* path, int error) {
    std::fprintf(stderr, "zkini: cannot %s %s: %s\n", doing, path, std::strerror(error ? error : EIO));
    return FileFailure;
}

int usageError(const zkStringBase& what) {
    std::fprintf(stderr, "zkini: %s\nTry 'zkini -help' for the switches.\n", what.data());
    return Usage;
}

// Text that cannot be written to the file or in the format asked for.
int refused(const zkStringBase& what) {
    std::fprintf(stderr, "zkini: %s\n", what.data());
    return Usage;
}

int printVersion() {
    std::printf("zkini %s\n", zkutilVersion());
    return std::fflush(stdout) == 0 ? Done : fileError("write", "standard output", errno);
}

class Tool {
public:
    explicit Tool(Arguments& args) : m_args(args) {}

    int Run();

private:
    int Get();
    int List();
    int Set();
    int Delete();
    int Merge();
    int Batch();
    // Applies one change of a batch: an editor result.
    int Apply(const BatchChange& change);
    int Rewrite(bool firewall);

    // Reads the file into m_editor; lock when it will be saved in place.
    int OpenFile(bool create);
    // Saves or prints m_editor's text where the result goes; a change in
    // place that changed nothing saves nothing.
    int WriteResult(bool changed);
    int Print(const zkStringBase& text);
    // Says, unless -quiet, that the section or (keyAsked) the key is missing.
    int NotFound(bool keyAsked);
    void LogChange();

    const zkStringBase& Arg(Arguments::Switch s) const { return m_args.ValueOf(s); }
    // Where the result goes: -out:, else the file ("-": standard output).
    const zkStringBase& Target() const {
        return m_args.Has(Arguments::Out) ? Arg(Arguments::Out) : Arg(Arguments::File);
    }
    bool InPlace() const { return !m_args.Has(Arguments::Out) && !IsStdStream(Arg(Arguments::File)); }

    Arguments& m_args;
    zkINIEditor m_editor;
    zkStringBase m_change;  // what the action did, for the log
};

int Tool::Run() {
    switch (m_args.GetAction()) {
    case Arguments::Get:
        return Get();
    case Arguments::List:
        return List();
    case Arguments::Set:
        return Set();
    case Arguments::Delete:
        return Delete();
    case Arguments::Merge:
        return Merge();
    case Arguments::Batch:
        return Batch();
    case Arguments::Normalize:
        return Rewrite(false);
    case Arguments::Firewall:
        return Rewrite(true);
    case Arguments::Version:
        return printVersion();
    default:
        std::fputs(kUsage, stdout);
        return std::fflush(stdout) == 0 ? Done : fileError("write", "standard output", errno);
    }
}

int Tool::OpenFile(bool create) {
    const zkStringBase& file = Arg(Arguments::File);
    if (IsStdStream(file)) {
        zkStringBase text;
        if (const int error = ReadPath(file, text)) return fileError("read", "standard input", error);
        m_editor.Load(text.data(), text.length());
        return Done;
    }
    m_editor.SetFilename(file.data());
    errno = 0;
    if (m_editor.Open(create, InPlace()) == zkINIEditor::Done) return Done;
    return fileError(errno == EWOULDBLOCK ? "lock" : "read", file.data(), errno);
}

int Tool::Print(const zkStringBase& text) {
    if (const int error = WriteAll(1, text)) return fileError("write", "standard output", error);
    return Done;
}

int Tool::NotFound(bool keyAsked) {
    if (m_args.Has(Arguments::Quiet)) return Missing;
    const zkStringBase& section = Arg(Arguments::Section);
    const zkStringBase& key = Arg(Arguments::Key);
    const char* file = shown(Arg(Arguments::File));
    if (!keyAsked || !m_editor.HasSection(section))
        std::fprintf(stderr, "zkini: no section '%s' in %s\n", section.data(), file);
    else
        std::fprintf(stderr, "zkini: no key '%s' in section '%s' of %s\n", key.data(), section.data(), file);
    return Missing;
}

int Tool::WriteResult(bool changed) {
    const zkStringBase& target = Target();
    if (IsStdStream(target)) {
        zkStringBase text;
        m_editor.GetText(text);
        return Print(text);
    }
    if (InPlace() && !changed) return Done;
    m_editor.SetFilename(target.data());
    errno = 0;
    if (m_editor.Save() != zkINIEditor::Done) return fileError("save", target.data(), errno);
    if (changed) LogChange();
    return Done;
}

void Tool::LogChange() {
    const zkStringBase& path = Arg(Arguments::Log);
    if (path.isNull()) return;
    zkLogFile log(path, 0);
    zkStringBase line(shown(Arg(Arguments::File)));
    line.append(": ").append(m_change).append(" -> ").append(Target());
    log.Log(line, zkLogFile::LevelNormal);
}

int Tool::Get() {
    int status = OpenFile(false);
    if (status != Done) return status;
    const zkStringBase& key = Arg(Arguments::Key);
    zkStringBase value;
    if (m_editor.GetVal(Arg(Arguments::Section), key, value) != zkINIEditor::Done) return NotFound(true);
    zkStringBase out, error;
    if (!FormatValue(FormatNamed(Arg(Arguments::Format)), key, value, out, error)) return refused(error);
    return Print(out);
}

int Tool::List() {
    int status = OpenFile(false);
    if (status != Done) return status;
    const Format format = FormatNamed(Arg(Arguments::Format));
    zkStringBase out, error;
    bool formatted;
    if (m_args.Has(Arguments::Section)) {
        if (!m_editor.HasSection(Arg(Arguments::Section))) return NotFound(false);
        formatted = FormatSection(format, m_editor, Arg(Arguments::Section), out, error);
    } else {
        formatted = FormatSectionNames(format, m_editor, out, error);
    }
    if (!formatted) return refused(error);
    return Print(out);
}

int Tool::Set() {
    const zkStringBase& section = Arg(Arguments::Section);
    const zkStringBase& key = Arg(Arguments::Key);
    const zkStringBase& value = Arg(Arguments::Value);
    // Checked before the file is opened, which may create it.
    const struct {
        bool valid;
        const char* what;
        const zkStringBase& text;
    } checks[] = {{zkINIEditor::IsValidSection(section), "section name", section},
                  {zkINIEditor::IsValidKey(key), "key", key},
                  {zkINIEditor::IsValidValue(value), "value", value}};
    for (const auto& check : checks)
        if (!check.valid) return refused(joined({"the ", check.what, " '", check.text.data(), "' cannot be written"}));
    const bool existing = m_args.Has(Arguments::Existing);
    int status = OpenFile(!existing);
    if (status != Done) return status;
    zkStringBase old;
    if (existing && m_editor.GetVal(section, key, old) != zkINIEditor::Done) return NotFound(true);
    if (m_editor.SetVal(section, key, value) == zkINIEditor::Refused)
        return refused("the key or value cannot be written");
    m_change.append("set [").append(section).append("] ").append(key).append('=').append(value);
    return WriteResult(true);
}

int Tool::Delete() {
    int status = OpenFile(false);
    if (status != Done) return status;
    const zkStringBase& section = Arg(Arguments::Section);
    const zkStringBase& key = Arg(Arguments::Key);
    const bool wholeSection = !m_args.Has(Arguments::Key);
    const int result = wholeSection ? m_editor.RemoveSection(section) : m_editor.RemoveKey(section, key);
    if (result == zkINIEditor::Missing && m_args.Has(Arguments::Existing)) return NotFound(!wholeSection);
    m_change.append("delete [").append(section).append(']');
    if (!wholeSection) m_change.append(' ').append(key);
    return WriteResult(result == zkINIEditor::Done);
}

int Tool::Merge() {
    const zkStringBase& path = Arg(Arguments::Merge);
    zkINIEditor other;
    if (IsStdStream(path)) {
        zkStringBase text;
        if (const int error = ReadPath(path, text)) return fileError("read", "standard input", error);
        other.Load(text.data(), text.length());
    } else {
        other.SetFilename(path.data());
        errno = 0;
        if (other.Open(false, false) != zkINIEditor::Done) return fileError("read", path.data(), errno);
    }
    int status = OpenFile(false);
    if (status != Done) return status;
    if (m_editor.MergeFrom(other) == zkINIEditor::Refused)
        return refused(joined({"a section, key or value of ", shown(path), " cannot be written"}));
    m_change.append("merge ").append(shown(path));
    return WriteResult(true);
}

int Tool::Apply(const BatchChange& change) {
    if (change.kind == BatchChange::DeleteKey) return m_editor.RemoveKey(change.section, change.key);
    if (change.kind == BatchChange::DeleteSection) return m_editor.RemoveSection(change.section);
    zkStringBase old;
    if (m_args.Has(Arguments::Existing) && m_editor.GetVal(change.section, change.key, old) != zkINIEditor::Done)
        return zkINIEditor::Missing;
    // A new key counts as done here: the change was made.
    const int result = m_editor.SetVal(change.section, change.key, change.value);
    return result == zkINIEditor::Refused ? result : zkINIEditor::Done;
}

int Tool::Batch() {
    const zkStringBase& file = Arg(Arguments::File);
    const zkStringBase& path = Arg(Arguments::Batch);
    // An existing file is locked first and the changes read while it is held;
    // a missing one is made only once all the changes have been read.
    struct stat st;
    const bool missingFile = !IsStdStream(file) && stat(file.data(), &st) != 0 && errno == ENOENT;
    int status = Done;
    if (!missingFile && (status = OpenFile(false)) != Done) return status;
    zkStringBase text, error;
    if (const int readError = ReadPath(path, text)) return fileError("read", shown(path), readError);
    std::vector<BatchChange> changes;
    if (!ParseBatch(text, changes, error)) return refused(joined({shown(path), " ", error.data()}));
    if (missingFile && (status = OpenFile(true)) != Done) return status;
    bool changed = false;
    for (const BatchChange& change : changes) {
        const int result = Apply(change);
        if (result == zkINIEditor::Done) {
            changed = true;
        } else if (result == zkINIEditor::Refused) {
            return refused(joined({shown(path), " line ", number(change.line).data(), " cannot be written"}));
        } else if (m_args.Has(Arguments::Existing)) {
            if (!m_args.Has(Arguments::Quiet))
                std::fprintf(stderr, "zkini: %s line %u: no such section or key\n", shown(path), change.line);
            return Missing;
        }
    }
    m_change = joined({"batch ", shown(path), " (", number(changes.size()).data(), " lines)"});
    return WriteResult(changed);
}

int Tool::Rewrite(bool firewall) {
    const zkStringBase& file = Arg(Arguments::File);
    const zkStringBase& target = Target();
    // The editor only holds the lock, so the rewrite does not race the
    // line-keeping changes of other runs.
    if (InPlace()) {
        m_editor.SetFilename(file.data());
        errno = 0;
        if (m_editor.Open(false, true) != zkINIEditor::Done)
            return fileError(errno == EWOULDBLOCK ? "lock" : "read", file.data(), errno);
    }
    // The document reads and writes only named files: standard input and
    // output pass through a temporary file.
    TempFile temp;
    const char* source = file.data();
    if (IsStdStream(file) || IsStdStream(target)) {
        if (const int error = temp.Create()) return fileError("create", "a temporary file", error);
    }
    if (IsStdStream(file)) {
        zkStringBase text;
        if (const int error = ReadPath(file, text)) return fileError("read", "standard input", error);
        if (const int error = WritePath(temp.Path(), text)) return fileError("write", temp.Path(), error);
        source = temp.Path();
    }
    struct stat st;
    if (stat(source, &st) != 0) return fileError("read", source, errno);
    zkMappedINIFile doc(source);
    errno = 0;
    if (doc.Open(1) != 0) return fileError("read", source, errno);
    doc.SetFilename(IsStdStream(target) ? temp.Path() : target.data());
    errno = 0;
    if ((firewall ? doc.CloseFW(1) : doc.Close(1)) != 0)
        return fileError("save", IsStdStream(target) ? temp.Path() : target.data(), errno);
    m_change = firewall ? "firewall" : "normalize";
    if (!IsStdStream(target)) {
        LogChange();
        return Done;
    }
    zkStringBase text;
    if (const int error = ReadPath(temp.Path(), text)) return fileError("read", temp.Path(), error);
    return Print(text);
}

}  // namespace

int main(int argc, char** argv) {
    Arguments args(argc, argv);
    if (!args.ParseCommand()) return usageError(args.Error());
    Tool tool(args);
    return tool.Run();
}
