// Rows read ahead: what is left of an open query before its connection writes, so that the query goes on showing what
// it was opened on. Up to 32 MB stay in memory, what is beyond lies in a temporary file until it is read.
#pragma once

#include <cstddef>
#include <cstdio>
#include <memory>
#include <span>
#include <vector>

#include "engine/datum.h"
#include "handles/status.h"

namespace engine::sqlite {

class RowStore {
public:
    // Copies a row. Throws std::bad_alloc.
    Status Add(std::span<const Datum> values);
    // The next row in order; its views stay valid until the next call. False at the end.
    bool Next(std::span<Datum> values, Status& status);
    void Clear() noexcept;

private:
    struct Block {
        std::unique_ptr<char[]> bytes;     // null: in the file
        std::size_t size = 0;              // room
        std::size_t used = 0;
        long file_offset = 0;
    };
    struct FileCloser {
        void operator()(std::FILE* file) const { std::fclose(file); }
    };

    char* Reserve(std::size_t size);
    Status Spill(Block& block);
    Status Load(Block& block);

    std::vector<Block> blocks_;
    std::size_t in_memory_ = 0;    // bytes of full blocks
    std::size_t block_ = 0;        // where Next reads
    std::size_t offset_ = 0;
    std::unique_ptr<std::FILE, FileCloser> file_;
};

}  // namespace engine::sqlite
