// Two versions parsed from arbitrary text order consistently.
#include "zkFuzzInput.h"
#include "zkVersionDescriptor.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    zkFuzzInput in(data, size);
    std::string first = in.text(64), second = in.rest();
    zkVersionDescriptor a(first.c_str()), b;
    ZK_FUZZ_CHECK(b.SetVersionDescriptor(second.c_str()) == 0);
    ZK_FUZZ_CHECK((a < b) + (b < a) + (a == b) == 1);
    ZK_FUZZ_CHECK((a > b) == (b < a));
    ZK_FUZZ_CHECK(a.IsInline(b) == (a.GetMajor() == b.GetMajor() && a.GetMinor() == b.GetMinor()));
    ZK_FUZZ_CHECK(a.GetMinor() >= 0);
    return 0;
}
