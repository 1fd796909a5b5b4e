// Threads of a test that are let go together.
#pragma once

#include <gtest/gtest.h>

#include <barrier>
#include <chrono>
#include <cstdlib>
#include <functional>
#include <future>
#include <vector>

// work(index) in threads of their own. Ends the process when they hang.
inline void AtOnce(int count, const std::function<void(int)>& work) {
    std::barrier start(count);
    std::vector<std::future<void>> threads;
    for (int index = 0; index < count; ++index) {
        threads.push_back(std::async(std::launch::async, [&, index] {
            start.arrive_and_wait();
            work(index);
        }));
    }
    for (std::future<void>& thread : threads) {
        if (thread.wait_for(std::chrono::seconds(60)) == std::future_status::ready) continue;
        ADD_FAILURE() << "the threads wait for each other";
        std::abort();
    }
}
