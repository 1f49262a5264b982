// Files: CreateFileW's dispositions and codes, synchronous ReadFile and WriteFile with their
// byte counts, and the faults tests arm on them over the layer.
#include "conformance.h"

#include <unistd.h>

#include <cstdio>
#include <string>

namespace {

class Files : public ::testing::Test {
protected:
    std::string path = ::testing::TempDir() + "hv-files-" + std::to_string(getpid()) + ".bin";
    WString name = conf::widen(path);

#if HV_OVER_LAYER
    void SetUp() override { w32test::reset(); }
#endif
    void TearDown() override {
        std::remove(path.c_str());
#if HV_OVER_LAYER
        EXPECT_EQ(w32test::openFileCount(), 0u);
        w32test::reset();
#endif
    }
    HANDLE open(DWORD access, DWORD disposition) {
        return CreateFileW(name.c_str(), access, 0, nullptr, disposition, FILE_ATTRIBUTE_NORMAL,
                           nullptr);
    }
    // Writes `text` into a new file and reopens it for reading.
    HANDLE fileWith(const std::string& text) {
        HANDLE w = open(GENERIC_WRITE, CREATE_ALWAYS);
        DWORD done = 0;
        EXPECT_TRUE(WriteFile(w, text.data(), static_cast<DWORD>(text.size()), &done, nullptr));
        CloseHandle(w);
        return open(GENERIC_READ, OPEN_EXISTING);
    }
};

TEST_F(Files, DispositionsAndTheirCodes) {
    EXPECT_EQ(open(GENERIC_READ, OPEN_EXISTING), INVALID_HANDLE_VALUE);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_FILE_NOT_FOUND));
    HANDLE created = open(GENERIC_WRITE, CREATE_ALWAYS);
    ASSERT_NE(created, INVALID_HANDLE_VALUE);
    EXPECT_TRUE(CloseHandle(created));
    HANDLE opened = open(GENERIC_READ, OPEN_EXISTING);
    ASSERT_NE(opened, INVALID_HANDLE_VALUE);
    EXPECT_TRUE(CloseHandle(opened));
    EXPECT_EQ(open(GENERIC_READ, 99), INVALID_HANDLE_VALUE);
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_PARAMETER));
    EXPECT_FALSE(CloseHandle(created)) << "closed twice";
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
}

TEST_F(Files, ReadsAndWritesReportTheirCounts) {
    HANDLE r = fileWith("abcdef");
    char buffer[8] = {};
    DWORD done = 99;
    EXPECT_TRUE(ReadFile(r, buffer, 4, &done, nullptr));
    EXPECT_EQ(done, 4u);
    EXPECT_TRUE(ReadFile(r, buffer + 4, 4, &done, nullptr));
    EXPECT_EQ(done, 2u) << "the file ends";
    EXPECT_STREQ(buffer, "abcdef");
    EXPECT_TRUE(ReadFile(r, buffer, 4, &done, nullptr));
    EXPECT_EQ(done, 0u) << "at the end a read succeeds with nothing";
    EXPECT_FALSE(WriteFile(r, "x", 1, &done, nullptr)) << "opened for reading only";
    EXPECT_EQ(done, 0u);
    CloseHandle(r);
    EXPECT_FALSE(ReadFile(r, buffer, 1, &done, nullptr));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_INVALID_HANDLE));
#if HV_OVER_LAYER
    auto reads = w32test::callsOf("ReadFile");
    ASSERT_GE(reads.size(), 2u);
    EXPECT_EQ(reads[0].args[2], 4u);
    EXPECT_EQ(reads[0].result, 1);
#endif
}

// A failed call touches nothing; a silent write reports success and 0 bytes; a short read
// moves the position only by what it delivered.
TEST_F(Files, ArmedFaults) {
    HV_LAYER_ONLY("fault injection");
#if HV_OVER_LAYER
    HANDLE w = open(GENERIC_WRITE, CREATE_ALWAYS);
    DWORD done = 99;
    w32test::failCall("WriteFile", 2, ERROR_DISK_FULL);
    w32test::silentWrite(3);
    EXPECT_TRUE(WriteFile(w, "ab", 2, &done, nullptr));
    EXPECT_FALSE(WriteFile(w, "cd", 2, &done, nullptr));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_DISK_FULL));
    EXPECT_EQ(done, 0u);
    done = 99;
    EXPECT_TRUE(WriteFile(w, "ef", 2, &done, nullptr));
    EXPECT_EQ(done, 0u);
    EXPECT_TRUE(WriteFile(w, "gh", 2, &done, nullptr));
    CloseHandle(w);

    HANDLE r = open(GENERIC_READ, OPEN_EXISTING);
    char buffer[8] = {};
    w32test::shortRead(1, 1);
    EXPECT_TRUE(ReadFile(r, buffer, 3, &done, nullptr));
    EXPECT_EQ(done, 2u);
    EXPECT_EQ(std::string(buffer, 2), "ab");
    w32test::shortRead(1, 0xFFFFFFFF);
    EXPECT_TRUE(ReadFile(r, buffer, 2, &done, nullptr));
    EXPECT_EQ(done, 0u);
    w32test::failCall("ReadFile", 1, ERROR_READ_FAULT);
    EXPECT_FALSE(ReadFile(r, buffer, 2, &done, nullptr));
    EXPECT_EQ(GetLastError(), static_cast<DWORD>(ERROR_READ_FAULT));
    EXPECT_TRUE(ReadFile(r, buffer, 8, &done, nullptr));
    EXPECT_EQ(std::string(buffer, done), "gh") << "only the first and last writes landed";
    CloseHandle(r);
#endif
}

TEST_F(Files, HandleOverAPipe) {
    HV_LAYER_ONLY("file handles over descriptors are the layer's");
#if HV_OVER_LAYER
    int fds[2];
    ASSERT_EQ(pipe(fds), 0);
    HANDLE in = w32test::fileHandleFromDescriptor(fds[0]);
    HANDLE out = w32test::fileHandleFromDescriptor(fds[1]);
    DWORD done = 0;
    EXPECT_TRUE(WriteFile(out, "xyz", 3, &done, nullptr));
    EXPECT_TRUE(CloseHandle(out));
    char buffer[4] = {};
    EXPECT_TRUE(ReadFile(in, buffer, 4, &done, nullptr));
    EXPECT_EQ(done, 3u);
    EXPECT_TRUE(CloseHandle(in));
#endif
}

}  // namespace
