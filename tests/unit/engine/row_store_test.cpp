// Rows and bytes that are kept, and what is left when memory or the disk fails.
#include <sys/resource.h>

#include <csignal>

#include "engine/chunked_bytes.h"
#include "engine/engine_fixture.h"
#include "engine/row_store.h"

namespace {

std::string At(engine::RowStore& store, std::uint64_t index, std::size_t columns) {
    std::vector<Datum> values(columns);
    const Status status = store.Read(index, values);
    if (status.Failed()) return "error " + std::to_string(status.Number());
    std::string text;
    for (const Datum& value : values) text += Shown(value) + ';';
    return text;
}

// Rows about as large as what is left of the first block: none reaches into the offsets of rows at the block's end.
TEST(RowStore, BlocksThatAreJustFull) {
    for (std::size_t before = 0; before < 8; ++before) {
        for (std::size_t length = 3700; length < 4100; ++length) {
            engine::RowStore store;
            const std::string text(length, 'x');
            const Datum number[] = {Integer(7)}, last[] = {Text(text)};
            for (std::size_t row = 0; row < before; ++row) ASSERT_TRUE(store.Add(number).Ok());
            ASSERT_TRUE(store.Add(last).Ok() && store.Add(last).Ok());
            for (std::size_t row = 0; row < before; ++row) ASSERT_EQ(At(store, row, 1), "7;");
            ASSERT_TRUE(At(store, before, 1) == text + ';') << before << " rows before one of " << length;
        }
    }
}

// The store's temporary file, cut short so that a block cannot be read whole: that read fails, and what came before is
// read again as it was. A store that is given up and filled anew has another file.
TEST(RowStore, ReadsOnAfterAFailure) {
    engine::RowStore store;
    for (int turn = 0; turn < 2; ++turn) {
        store.Clear();
        for (char row = 'a'; row < 'z'; ++row) {
            const std::string text(4000000, static_cast<char>(row - turn));
            const Datum values[] = {Text(text)};
            ASSERT_TRUE(store.Add(values).Ok()) << turn << row;
        }
        EXPECT_EQ(At(store, 8, 1), std::string(4000000, static_cast<char>('i' - turn)) + ';');
    }
    for (const auto& entry : std::filesystem::directory_iterator("/proc/self/fd")) {
        std::error_code none;
        if (std::filesystem::read_symlink(entry, none).string().ends_with("(deleted)")) {
            ASSERT_EQ(truncate(entry.path().c_str(), 4000000 * 3 / 2), 0);
        }
    }
    Datum value[1];
    std::size_t row = 0;
    while (row < 25 && store.Read(row, value).Ok()) ++row;
    ASSERT_LT(row, 25u) << "a part of the file is gone";
    EXPECT_EQ(At(store, row - 1, 1), std::string(4000000, static_cast<char>('a' + row - 2)) + ';');
}

// While one lives, no file grows beyond that size.
class FilesOf {
public:
    explicit FilesOf(rlim_t size) {
        getrlimit(RLIMIT_FSIZE, &before_);
        const rlimit small{size, before_.rlim_max};
        EXPECT_EQ(setrlimit(RLIMIT_FSIZE, &small), 0);
    }
    ~FilesOf() {
        setrlimit(RLIMIT_FSIZE, &before_);
        std::signal(SIGXFSZ, signal_);
    }

private:
    rlimit before_{};
    void (*signal_)(int) = std::signal(SIGXFSZ, SIG_IGN);
};

// A file that may not grow: the row that does not fit is refused, those before it stay, and so does the next one.
TEST(RowStore, RefusedRowLeavesTheOthers) {
    engine::RowStore store;
    const std::string text(100000, 'x');
    auto small = std::make_unique<FilesOf>(1000000);
    std::uint64_t added = 0;
    Status status;
    for (; added < 1000; ++added) {
        const Datum values[] = {Integer(static_cast<std::int64_t>(added)), Text(text)};
        status = store.Add(values);
        if (status.Failed()) break;
    }
    EXPECT_EQ(status.Number(), 1653);
    EXPECT_GT(added, 250u);
    EXPECT_EQ(store.Size(), added);
    small.reset();
    const Datum last[] = {Integer(-1), Text(text)};
    ASSERT_TRUE(store.Add(last).Ok());
    EXPECT_EQ(At(store, added, 2), "-1;" + text + ';');
    for (std::uint64_t row = 0; row < added; ++row)
        ASSERT_EQ(At(store, row, 2), std::to_string(row) + ';' + text + ';');
}

// Behind 512 chunks in memory: what does not fit leaves what was there, before the first chunk and behind it.
TEST(ChunkedBytes, StayWhereTheDiskIsFull) {
    const auto file = std::make_shared<engine::ChunkFile>();
    std::vector<std::uint32_t> others(512);
    for (std::uint32_t& chunk : others) ASSERT_TRUE(file->Take(chunk).Ok());
    engine::ChunkedBytes bytes(file, std::byte{'.'});
    const std::string brief(3000, 'a'), text(100000, 'b');
    const auto write = [&](std::uint64_t at, const std::string& part) { return bytes.Write(at, std::as_bytes(std::span(part))).Number(); };
    std::string wanted = brief;
    const auto is_whole = [&] {
        std::string read(1000000, '#');
        std::size_t length = 0;
        return bytes.Read(0, std::as_writable_bytes(std::span(read)), length).Ok() && read.substr(0, length) == wanted;
    };
    ASSERT_EQ(write(0, brief), 0);
    for (const std::uint64_t at : {3000, 250000}) {
        const auto full = std::make_unique<FilesOf>(0);
        EXPECT_EQ(write(at, text), 1653);
        EXPECT_TRUE(is_whole()) << at;
    }
    for (const std::uint64_t at : {3000, 250000}) {
        EXPECT_EQ(write(at, text), 0);
        wanted.resize(at, '.');
        wanted += text;
        EXPECT_TRUE(is_whole()) << at;
    }
    file->GiveBack(others);
    EXPECT_TRUE(is_whole());
}

}  // namespace
