// The file package on real files.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <thread>
#include <vector>

#include "support/call_fixture.h"

namespace {

class FileCalls : public CallFixture {
protected:
    void SetUp() override {
        CallFixture::SetUp();
        folder_ = Folder();
        ASSERT_EQ(OCIFileInit(env_, err_), OCI_SUCCESS);
    }
    void TearDown() override {
        EXPECT_EQ(OCIFileTerm(env_, err_), OCI_SUCCESS);
        CallFixture::TearDown();
    }

    sb4 Open(const char* name, ub4 mode, ub4 create, OCIFileObject** file) {
        return Answer(OCIFileOpen(env_, err_, file, Text(name), Text(folder_), mode, create, OCI_FILE_BIN));
    }
    std::string folder_;
};

// However an opening ends, the process holds no more descriptors than files are open, and these are the owner's to use.
TEST_F(FileCalls, OpeningsLeaveNoDescriptors) {
    const auto descriptors = [] {
        const std::filesystem::directory_iterator all("/proc/self/fd");
        return std::distance(begin(all), end(all));
    };
    const auto before = descriptors();
    const struct { const char* name; ub4 mode, create; sb4 answer; } cases[] = {
        {"made", OCI_FILE_READ_WRITE, OCI_FILE_EXCL, 0}, {"made", OCI_FILE_READ_WRITE, OCI_FILE_EXCL, 30151},
        {"made", OCI_FILE_READ_ONLY, OCI_FILE_TRUNCATE, 0}, {".", OCI_FILE_READ_ONLY, OCI_FILE_EXIST, 30158},
        {"made", 0, OCI_FILE_CREATE, 30150}, {"made", 4, OCI_FILE_CREATE, 30150}, {"made", OCI_FILE_READ_WRITE, 16, 30150}};
    for (const auto& c : cases) {
        OCIFileObject* file = nullptr;
        ASSERT_EQ(Open(c.name, c.mode, c.create, &file), c.answer) << c.name << ' ' << c.mode << ' ' << c.create;
        if (file) {
            EXPECT_EQ(Answer(OCIFileClose(env_, err_, file)), 0);
        }
        EXPECT_EQ(descriptors(), before) << c.name << ' ' << c.mode << ' ' << c.create;
    }
    EXPECT_EQ(access((folder_ + "/made").c_str(), R_OK | W_OK), 0);
    EXPECT_NE(access((folder_ + "/made").c_str(), X_OK), 0);
    OCIFileObject* file = nullptr;
    static ub4 count = 0;    // not on the stack, behind which there may be less than what is to be read
    ASSERT_EQ(Open("made", OCI_FILE_READ_WRITE, OCI_FILE_EXIST, &file), 0);
    EXPECT_EQ(Answer(OCIFileRead(env_, err_, file, &count, kHuge, &count)), 30150) << "the system's own refusal";
    EXPECT_EQ(Answer(OCIFileRead(env_, err_, file, &count, 256U << 20, &count)), 0) << "an empty file";
    EXPECT_EQ(Answer(OCIFileWrite(env_, err_, file, nullptr, 0, &count)), 30150);
    EXPECT_EQ(Answer(OCIFileSeek(env_, err_, file, 0, 0, OCI_FILE_FORWARD)), 30150);
    std::string name(300, 'n');
    ubig_ora length = 7;
    ub1 exists = 7;
    SHOULD(Answer(OCIFileGetLength(env_, err_, Text(name), Text(folder_), &length)) - 30160,
           Answer(OCIFileExists(env_, err_, Text(name), Text(folder_), &exists)) - 30160);
    EXPECT_EQ(length * exists, 49u) << "no answer";
    EXPECT_EQ(Answer(OCIFileOpen(env_, err_, &file, Text("ostype"), Text("/proc/sys/kernel"), OCI_FILE_READ_ONLY,
                                 OCI_FILE_TRUNCATE, OCI_FILE_BIN)), 30157) << "what nobody can empty";
}

// A thread waits in a read from a pipe, another in a close behind it, further ones behind that: the close is done once,
// and who comes after it is told.
TEST_F(FileCalls, ClosedWhileOthersWaitForTheirTurn) {
    const std::string pipe = folder_ + "/pipe";
    ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
    const int other_end = open(pipe.c_str(), O_RDWR);
    OCIFileObject* file = nullptr;
    char data[8];
    ub4 count = 0;
    const std::function<sword(OCIError*)> calls[] = {
        [&](OCIError* err) { return OCIFileRead(env_, err, file, data, 1, &count); },
        [&](OCIError* err) { return OCIFileClose(env_, err, file); },
        [&](OCIError* err) { return OCIFileSeek(env_, err, file, OCI_FILE_SEEK_BEGINNING, 1, OCI_FILE_FORWARD); },
        [&](OCIError* err) { return OCIFileClose(env_, err, file); },
        [&](OCIError* err) { return OCIFileRead(env_, err, file, data + 1, 1, &count); },
        [&](OCIError* err) { return OCIFileFlush(env_, err, file); }};
    for (int round = 0; round < 10; ++round) {
        ASSERT_EQ(Open("pipe", OCI_FILE_READ_ONLY, OCI_FILE_EXIST, &file), 0);
        std::atomic<int> closed{0}, told{0};
        std::vector<std::thread> threads;
        for (const auto& call : calls) {
            const bool closes = &call == &calls[1] || &call == &calls[3];
            threads.emplace_back([&, closes] {
                auto* err = New<OCIError>(OCI_HTYPE_ERROR);
                const sb4 answer = Answer(call(err), err);
                closed += closes && answer == 0;
                told += answer == 30153;
                OCIHandleFree(err, OCI_HTYPE_ERROR);
            });
            std::this_thread::sleep_for(std::chrono::milliseconds(3));
        }
        EXPECT_EQ(write(other_end, "kk", 2), 2);    // one byte each for the two that may read
        for (std::thread& thread : threads) thread.join();
        EXPECT_EQ(closed, 1) << "round " << round;
        EXPECT_GE(told, 1) << "round " << round;
        EXPECT_EQ(Answer(OCIFileFlush(env_, err_, file)), 30153);
    }
    close(other_end);
}

}  // namespace
