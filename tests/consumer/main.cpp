// Uses one class of each family through zkutil's headers, in both include
// forms, and checks that the library it runs with is the one it was built for.
#include <zkBStringTokenizer.h>
#include <zkCommandLineParser.h>
#include <zkStringBase.h>
#include <zkutil/zkVersionDescriptor.h>
#include <zkutil/zkutilVersion.h>

#include <cstdio>
#include <cstring>

int main() {
    zkStringBase line("a, b ,c");
    zkBStringTokenizer tokens(line, zkBStringTokenizer::m_csvToken, true);
    zkStringBase token, joined;
    while (tokens.GetNext(token)) joined.append(token);

    zkCommandLineParser args(zkStringBase("prog -name:value"));
    args.ParseCommand();

    zkVersionDescriptor older("1.2a"), newer("1.10");
    bool ok = joined == "abc" && args.GetValue("name") == "value" && older < newer &&
              std::strcmp(zkutilVersion(), ZKUTIL_VERSION) == 0;
    std::printf("consumer of zkutil %s: %s\n", zkutilVersion(), ok ? "ok" : "FAILED");
    return ok ? 0 : 1;
}
