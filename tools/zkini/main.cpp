// zkini: reads and changes INI files from the command line.
//
// Options take the library's switch syntax, -name:value. A bare switch such
// as -get is read by its first letter, so the actions have distinct ones:
//
//   -get -section:S -key:K          print the value
//   -set -section:S -key:K -value:V set the value, making key and section
//   -delete -section:S -key:K       remove the key
//   -list [-section:S]              list the sections, or a section's keys
//   -merge:OTHER                    merge OTHER into the file (its values win)
//   -normalize                      rewrite the file in the library's form
//   -firewall                       rewrite the file in the firewall form
//   -version, -help
//
// -file:PATH names the INI file; -out:PATH writes the result there instead;
// -log:PATH appends a line per change to a log file.
//
// Exit status: 0 done; 1 the section or key does not exist; 2 bad usage, or
// a file that cannot be read or saved.
#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <list>

#include "zkCommandLineParser.h"
#include "zkLogFile.h"
#include "zkMappedINIFile.h"
#include "zkStringBase.h"
#include "zkVersionDescriptor.h"

#ifndef ZKINI_VERSION
#define ZKINI_VERSION "0.1"
#endif

namespace {

enum ExitStatus { Done = 0, Missing = 1, Failed = 2 };

const char kUsage[] =
    "usage: zkini -file:PATH ACTION [-out:PATH] [-log:PATH]\n"
    "actions:\n"
    "  -get -section:S -key:K           print the value of K in S\n"
    "  -set -section:S -key:K -value:V  set K in S to V (both made when missing)\n"
    "  -delete -section:S -key:K        remove K from S\n"
    "  -list [-section:S]               list the sections, or the keys of S\n"
    "  -merge:OTHER                     merge OTHER into the file; its values win\n"
    "  -normalize                       rewrite the file in normal form\n"
    "  -firewall                        rewrite the file in firewall form\n"
    "  -version                         print the version\n"
    "  -help                            print this text\n"
    "exit status: 0 done, 1 no such section or key, 2 bad usage or a file error\n";

// The actions, by the first letter of their bare switch.
struct Action {
    const char* letter;
    bool changes;      // whether the file is written afterwards
    bool needsKey;     // whether -section and -key are required
};

const Action kGet{"g", false, true};
const Action kSet{"s", true, true};
const Action kDelete{"d", true, true};
const Action kList{"l", false, false};
const Action kNormalize{"n", true, false};
const Action kFirewall{"f", true, false};
const Action kMerge{"merge", true, false};

int usageError(const char* what) {
    std::fprintf(stderr, "zkini: %s\n", what);
    std::fputs(kUsage, stderr);
    return Failed;
}

int fileError(const char* doing, const char* path, int error) {
    std::fprintf(stderr, "zkini: cannot %s %s: %s\n", doing, path, std::strerror(error));
    return Failed;
}

bool fileExists(const char* path) {
    struct stat st;
    return stat(path, &st) == 0;
}

// Loads path into doc, read-only. A missing file is an error unless
// missingIsEmpty, when the document stays empty.
int load(zkMappedINIFile& doc, const char* path, bool missingIsEmpty) {
    if (!fileExists(path)) {
        if (missingIsEmpty && errno == ENOENT) return Done;
        return fileError("read", path, errno);
    }
    doc.SetFilename(path);
    errno = 0;
    if (doc.Open(1) != 0) return fileError("read", path, errno ? errno : EIO);
    return Done;
}

class Tool {
public:
    Tool(int argc, char** argv) : m_args(argc, argv) {}

    int Run();

private:
    const Action* ChooseAction(int& status);
    int Get();
    int Set();
    int Delete();
    int List();
    int Merge();
    int Save(const Action& action);
    void LogChange();

    const zkStringBase& Arg(const char* name) const { return m_args.GetValue(name); }

    zkCommandLineParser m_args;
    zkMappedINIFile m_doc;
    zkStringBase m_change;  // what the action did, for the log once saved
};

const Action* Tool::ChooseAction(int& status) {
    const Action* chosen = nullptr;
    for (const Action* action : {&kGet, &kSet, &kDelete, &kList, &kNormalize, &kFirewall, &kMerge}) {
        if (!m_args.Exists(action->letter)) continue;
        if (chosen) {
            status = usageError("give one action");
            return nullptr;
        }
        chosen = action;
    }
    if (!chosen) status = usageError("no action given");
    return chosen;
}

int Tool::Run() {
    m_args.ParseCommand();
    if (m_args.Exists("h")) {
        std::fputs(kUsage, stdout);
        return Done;
    }
    if (m_args.Exists("v")) {
        zkVersionDescriptor version(ZKINI_VERSION);
        std::printf("zkini %d.%d", version.GetMajor(), version.GetMinor());
        if (version.GetSubMinor()) std::printf("%c", version.GetSubMinor());
        std::printf("\n");
        return Done;
    }
    int status = Done;
    const Action* action = ChooseAction(status);
    if (!action) return status;
    const zkStringBase& file = Arg("file");
    if (file.isNull()) return usageError("no -file:PATH given");
    if (action->needsKey && (Arg("section").isNull() || Arg("key").isNull()))
        return usageError("this action needs -section:S and -key:K");
    if (action == &kSet && !m_args.Exists("value")) return usageError("-set needs -value:V");

    status = load(m_doc, file.data(), action == &kSet);
    if (status != Done) return status;

    if (action == &kGet) return Get();
    if (action == &kList) return List();
    if (action == &kSet) status = Set();
    if (action == &kDelete) status = Delete();
    if (action == &kMerge) status = Merge();
    if (status != Done) return status;
    return Save(*action);
}

int Tool::Get() {
    zkStringBase value;
    if (m_doc.GetVal(Arg("section"), Arg("key"), value) != 0) return Missing;
    std::printf("%s\n", value.data());
    return Done;
}

int Tool::List() {
    const zkStringBase& section = Arg("section");
    if (section.isNull()) {
        std::list<zkStringBase> names;
        m_doc.GetSectionNameList(names);
        for (const zkStringBase& name : names) std::printf("%s\n", name.data());
        return Done;
    }
    std::list<INILine*>* lines = m_doc.GetPropertyList(section.data());
    if (!lines) return Missing;
    for (const INILine* line : *lines)
        if (!line->m_isComment) std::printf("%s=%s\n", line->m_key.data(), line->m_value.data());
    return Done;
}

int Tool::Set() {
    m_doc.SetVal(Arg("section"), Arg("key"), Arg("value"));
    m_change.append("set [").append(Arg("section")).append("] ").append(Arg("key")).append('=');
    m_change.append(Arg("value"));
    return Done;
}

int Tool::Delete() {
    std::list<INILine*>* lines = m_doc.GetPropertyList(Arg("section").data());
    if (!lines || m_doc.FindKey(lines, Arg("key")) == lines->end()) return Missing;
    m_doc.RemoveKey(Arg("section"), Arg("key"));
    m_change.append("delete [").append(Arg("section")).append("] ").append(Arg("key"));
    return Done;
}

int Tool::Merge() {
    zkMappedINIFile other;
    int status = load(other, Arg("merge").data(), false);
    if (status != Done) return status;
    m_doc.MergeFrom(other);
    other.Close(0);
    m_change.append("merge ").append(Arg("merge"));
    return Done;
}

int Tool::Save(const Action& action) {
    const zkStringBase& out = Arg("out").isNull() ? Arg("file") : Arg("out");
    m_doc.SetFilename(out.data());
    errno = 0;
    int result = &action == &kFirewall ? m_doc.CloseFW(1) : m_doc.Close(1);
    if (result != 0) return fileError("save", out.data(), errno ? errno : EINVAL);
    if (&action == &kNormalize) m_change = "normalize";
    if (&action == &kFirewall) m_change = "firewall";
    m_change.append(" -> ").append(out);
    LogChange();
    return Done;
}

void Tool::LogChange() {
    const zkStringBase& path = Arg("log");
    if (path.isNull()) return;
    zkLogFile log(path, 0);
    zkStringBase line(Arg("file"));
    line.append(": ").append(m_change);
    log.Log(line, zkLogFile::LevelNormal);
}

}  // namespace

int main(int argc, char** argv) {
    Tool tool(argc, argv);
    return tool.Run();
}
