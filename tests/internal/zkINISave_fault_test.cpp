// The INI save, compiled in with the boundary: an in-place save reserves
// room for exactly the text it writes, so a full disk stops it before the
// old bytes are touched.
#include "ini/zkIniTestSupport.h"
#include "support/zkFaults.h"

namespace {

off_t gReservedTo = 0;  // where the last reservation ended

using IniSaveFault = zkFaultTest;

// The rows of ini_saves.txt, each saved in place.
TEST_F(IniSaveFault, InPlaceSaveReservesWhatItWrites) {
    zkSystemCalls recording = kRealCalls;
    recording.allocate = [](int fd, off_t at, off_t length) {
        gReservedTo = at + length;
        return kRealCalls.allocate(fd, at, length);
    };
    zkForEachRow("ini_saves.txt", [&](const auto& row) {
        zkMappedINIFile ini;
        ASSERT_EQ(0, zkLoad(ini, m_dir, "source.ini", zkTestText(row[0])));
        ASSERT_TRUE(zkWriteFile(m_dir.file("a.ini"), "[s]\n"));  // shorter than every text saved
        ini.SetFilename(m_dir.file("a.ini").c_str());
        gReservedTo = 0;
        zkArm(zkSteps({"rename:0:-1:EACCES"}, 0), recording);
        EXPECT_EQ(0, row[1] == "firewall" ? ini.CloseFW(1) : ini.Close(1));
        zkSystem = kRealCalls;
        EXPECT_EQ(static_cast<off_t>(zkReadFile(m_dir.file("a.ini")).size()), gReservedTo);
    });
}

}  // namespace
