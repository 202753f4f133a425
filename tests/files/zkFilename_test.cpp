// The platform file layer: zkFilename, the handle functions and zkDirIterator.
#include <map>
#include <thread>
#include <tuple>

#include "zkFilesTest.h"

// "path=directory|name|extension|protocol"
static std::string parts(const zkFilename& f) {
    return std::string(f.GetFullPath()) + "=" + f.GetDirectory() + "|" + f.GetName() + "|" + f.GetExtension() + "|" +
           f.GetProtocol();
}

// A copy and an assigned name hold the same parts.
TEST(Filename, PartsOfAPath) {
    using Setter = void (zkFilename::*)(const char*);
    const std::map<std::string, Setter> setters = {
        {"name", &zkFilename::SetName}, {"ext", &zkFilename::SetExtension}, {"dir", &zkFilename::SetDirectory}};
    for (const auto& row : zkCases("files_names.txt")) {
        SCOPED_TRACE(testing::PrintToString(row));
        zkFilename f(row[0].c_str());
        if (!row[1].empty()) (f.*setters.at(row[1]))(row[2].c_str());
        EXPECT_EQ(row[3], parts(f));
        EXPECT_EQ(row[3], parts(zkFilename(f)));
        EXPECT_EQ(row[3], parts(zkFilename("/old/name.ext") = f));
    }
    // Parts set directly: a directory without its separator, and a name
    // holding a directory part of its own.
    zkFilename direct;
    zkFilename::Dup(&direct.m_dir, "/d", -1);
    zkFilename::Dup(&direct.m_fname, "s/b", -1);
    direct.Rebuild(0, 0, 0, 0, 0);
    EXPECT_EQ("/d/s/b=/d/s/|b||file", parts(direct));
}

// GetType follows links; FileExists follows them unless told not to.
TEST(Filename, TypeOnDisk) {
    zkTempDir dir;
    zkPlant(dir.path(), "f=x dl->. dangling->none");
    // path, GetType, FileExists(1), FileExists(0)
    const std::tuple<std::string, int, int, int> cases[] = {{dir.file("dl"), 1, 1, 1},  {dir.file("f"), 2, 1, 1},
                                                            {"/dev/null", 3, 1, 1},     {dir.file("dangling"), 0, 1, 0},
                                                            {dir.file("f/x"), 0, 0, 0}, {dir.file("none"), 0, 0, 0}};
    for (const auto& [path, type, exists, existsFollowed] : cases) {
        SCOPED_TRACE(path);
        EXPECT_EQ(type, zkFilename(path.c_str()).GetType());
        EXPECT_EQ(exists, zkFilename(path.c_str()).FileExists(1));
        EXPECT_EQ(existsFollowed, zkFilename(path.c_str()).FileExists(0));
    }
}

// Each call on a closed handle fails: -1, 0 and, for a size, all ones.
TEST(HandleFiles, ResultsOfEachCall) {
    zkTempDir dir;
    const std::string path = dir.file("h");
    const int out = CreateFile(path.c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr);
    EXPECT_EQ(FD_CLOEXEC, fcntl(out, F_GETFD) & FD_CLOEXEC);
    EXPECT_EQ(-1, CreateFile(path.c_str(), O_CREAT | O_WRONLY, 0222, 0, O_EXCL, 0664, nullptr));
    EXPECT_EQ(-1, CreateFile(nullptr, O_RDONLY, 0, 0, 0, 0, nullptr));
    unsigned done = 99, high = 99;
    EXPECT_EQ(1, WriteFile(out, "a", 1, &done, nullptr));
    EXPECT_EQ(1, CloseHandle(out));
    EXPECT_EQ(0, CloseHandle(out));

    const int in = CreateFile(path.c_str(), O_RDONLY, 0, 0, 0, 0, nullptr);
    char buffer[8];
    EXPECT_EQ(1, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(1u, done);
    EXPECT_EQ(1, ReadFile(in, buffer, sizeof buffer, &done, nullptr));  // the end
    EXPECT_EQ(0u, done);
    // A size past 4 GiB comes as its low word, the high word apart.
    ASSERT_EQ(0, truncate(path.c_str(), (5ll << 30) + 3));
    EXPECT_EQ((1u << 30) + 3, GetFileSize(in, &high));
    EXPECT_EQ(1u, high);
    CloseHandle(in);
    done = 99;
    EXPECT_EQ(0, ReadFile(in, buffer, sizeof buffer, &done, nullptr));
    EXPECT_EQ(0u, done);
    EXPECT_EQ(0xFFFFFFFFu, GetFileSize(in, &high));
    EXPECT_EQ(0xFFFFFFFFu, high);
    EXPECT_EQ(0xFFFFFFFFu, GetFileSize(in, nullptr));
}

// Each interrupted write returns short, and the rest must follow from there.
TEST(HandleFiles, WriteFileGoesOnAfterShortWrites) {
    if (zkUnderEmulator()) GTEST_SKIP() << "the emulator cannot interrupt a blocking write as the kernel does";
    std::string data((1 << 19) + 1000, '\0');  // not a whole number of blocks
    for (size_t i = 0; i < data.size(); ++i) data[i] = static_cast<char>(i % 251);
    unsigned done = 0;
    int result = 0;
    EXPECT_EQ(data, zkReadFromShortWrites([&](int fd) {
                  result = WriteFile(fd, data.data(), static_cast<unsigned>(data.size()), &done, nullptr);
              }));
    EXPECT_EQ(1, result);
    EXPECT_EQ(data.size(), done);
}

// A call interrupted before it moved a byte is made again: a read of an
// empty pipe, then a write to a full one.
TEST(HandleFiles, InterruptedCallsAreMadeAgain) {
    if (zkUnderEmulator()) GTEST_SKIP() << "the emulator cannot interrupt a blocking call as the kernel does";
    struct sigaction action = {}, saved;
    action.sa_handler = [](int) {};  // without SA_RESTART
    int ends[2];
    ASSERT_EQ(0, sigaction(SIGUSR1, &action, &saved));
    ASSERT_EQ(0, pipe2(ends, O_CLOEXEC));
    const std::string fill(static_cast<size_t>(fcntl(ends[1], F_GETPIPE_SZ)), 'f');
    const pthread_t caller = pthread_self();
    // The pauses let the caller block before each signal and the next step.
    std::thread other([&] {
        std::string drained(fill.size(), '\0');
        usleep(50000);
        pthread_kill(caller, SIGUSR1);
        usleep(50000);
        EXPECT_EQ(1, write(ends[1], "x", 1));
        usleep(100000);
        pthread_kill(caller, SIGUSR1);
        usleep(50000);
        EXPECT_LT(0, read(ends[0], &drained[0], drained.size()));
    });
    char byte = 0;
    unsigned done = 0;
    EXPECT_EQ(1, ReadFile(ends[0], &byte, 1, &done, nullptr));
    EXPECT_EQ(1u, done);
    EXPECT_EQ(static_cast<ssize_t>(fill.size()), write(ends[1], fill.data(), fill.size()));
    EXPECT_EQ(1, WriteFile(ends[1], "y", 1, &done, nullptr));
    other.join();
    close(ends[0]);
    close(ends[1]);
    sigaction(SIGUSR1, &saved, nullptr);
}

// Names in byte order; a copy goes on from the same name on its own. The
// directory is read once and closed.
TEST(DirIterator, ListsMatchingNamesInOrder) {
    zkTempDir dir;
    zkPlant(dir.path(), "b= a*= ab= c=");
    const int next = dup(0);  // the lowest free descriptor, which the iterator takes while reading
    close(next);
    EXPECT_EQ(nullptr, zkDirIterator((dir.path() + "/x*").c_str()).GetName());
    EXPECT_EQ(-1, fcntl(next, F_GETFD));
    EXPECT_STREQ("a*", zkDirIterator((dir.path() + "/a\\*").c_str()).GetName());
    EXPECT_STREQ("dev", zkDirIterator("/dev").GetName());  // a directory part of "/"
    zkDirIterator it((dir.path() + "/[a-c]*").c_str()), assigned;
    ++it;
    zkDirIterator copy(it);
    assigned = it;
    assigned = assigned;
    EXPECT_TRUE(copy == it);  // the same name in another buffer
    EXPECT_FALSE(++zkDirIterator(it) == it);
    std::string names;
    for (; copy != zkDirIterator(); ++copy, ++assigned) {
        EXPECT_STREQ(copy.GetName(), assigned.GetName());
        names += std::string(copy.GetName()) + " ";
    }
    EXPECT_TRUE(assigned == zkDirIterator());
    EXPECT_EQ("ab b c ", names);
    EXPECT_STREQ("ab", it.GetName());
    EXPECT_FALSE(it == zkDirIterator());
}
