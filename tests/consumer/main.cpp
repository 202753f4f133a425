// Uses one class of each family through the installed headers and library.
#include <zkBStringTokenizer.h>
#include <zkCommandLineParser.h>
#include <zkStringBase.h>
#include <zkVersionDescriptor.h>

#include <cstdio>

int main() {
    zkStringBase line("a, b ,c");
    zkBStringTokenizer tokens(line, zkBStringTokenizer::m_csvToken, true);
    zkStringBase token, joined;
    while (tokens.GetNext(token)) joined.append(token);

    zkCommandLineParser args(zkStringBase("prog -name:value"));
    args.ParseCommand();

    zkVersionDescriptor older("1.2a"), newer("1.10");
    bool ok = joined == "abc" && args.GetValue("name") == "value" && older < newer;
    std::printf("consumer: %s\n", ok ? "ok" : "FAILED");
    return ok ? 0 : 1;
}
