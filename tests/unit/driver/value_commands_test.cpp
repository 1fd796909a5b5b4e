// The rows of the commands on values, files and threads: that each usage text promises the word counts that are taken.
#include <gtest/gtest.h>

#include <map>
#include <set>
#include <sstream>
#include <string>

#include "loop/dispatch.h"

namespace {

// What a usage text promises: each word counts one, a pair of brackets as a whole is there or not.
std::set<int> CountsOf(const std::string& usage) {
    std::set<int> counts = {0};
    std::istringstream words(usage);
    bool optional = false;
    int group = 0;
    for (std::string word; words >> word;) {
        if (word.front() == '[') optional = true;
        ++group;
        if (optional && word.back() != ']') continue;
        std::set<int> longer;
        for (int count : counts) {
            longer.insert(count + group);
            if (optional) longer.insert(count);
        }
        counts = longer;
        optional = false;
        group = 0;
    }
    return counts;
}

std::set<int> CountsTaken(const CommandRow& row) {
    std::set<int> counts;
    for (int count = 0; count <= 40; ++count)
        if (row.words.Has(count)) counts.insert(count);
    return counts;
}

TEST(ValueCommands, UsageTextsPromiseTheWordCountsTaken) {
    // Those whose usage texts say it otherwise.
    std::map<int, std::set<int>> exceptions = {{252, {2, 3, 4}}, {253, {2, 3, 4}}};
    for (int count = 5; count <= 40; ++count) exceptions[262].insert(count);

    const struct {
        int first, last;
    } ranges[] = {{220, 280}, {282, 296}, {331, 334}, {354, 359}, {377, 401}, {411, 411}};
    int commands = 0;
    for (const auto& range : ranges) {
        for (int code = range.first; code <= range.last; ++code) {
            const HandlerTable::Handler* const handler = Handlers().Find(static_cast<Code>(code));
            ASSERT_NE(handler, nullptr) << code;
            const CommandRow& row = *handler->row;
            const auto exception = exceptions.find(code);
            EXPECT_EQ(CountsTaken(row), exception == exceptions.end() ? CountsOf(row.usage) : exception->second)
                << row.usage;
            ++commands;
        }
    }
    EXPECT_EQ(commands, 45 + 19 + 13 + 10 + 25);
}

}  // namespace
