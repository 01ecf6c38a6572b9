// GoogleTest does not say that the folder for temporary files is full: what a test captures is then empty. So each
// test that fails while that folder is full gives the reason, too.

#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

void tellIfFull(const std::string& folder)
{
    std::string name = folder + "/fullXXXXXX";
    const int file = mkstemp(name.data());
    if (file < 0 || write(file, "", 1) != 1)
        std::printf("No file can be written in %s: %s\n", folder.c_str(), std::strerror(errno));
    if (file >= 0) {
        close(file);
        unlink(name.c_str());
    }
}

class FullDisk : public testing::EmptyTestEventListener {
    void OnTestEnd(const testing::TestInfo& test) override
    {
        if (test.result()->Failed()) {
            tellIfFull(P_tmpdir);  // std::tmpfile, and GoogleTest before 1.13
            tellIfFull(testing::TempDir());
        }
    }
};

[[maybe_unused]] const bool isAppended =
    (testing::UnitTest::GetInstance()->listeners().Append(new FullDisk), true);

}  // namespace
