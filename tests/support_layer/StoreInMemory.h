/// The store in memory, on a machine that is driven by hand: what the tests of this layer begin with.
#pragma once

#include "support/VKFileManagerExtensions.h"

#include "support/FakeFileManager.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <string>
#include <vector>

using Line = base::MemoryLog::Line;
using Kind = Line::Kind;

inline const std::string kStore = VKScreenRecorderTempDirectory;
inline constexpr double kNow = 1'700'000'000;

class TemporaryFileStore : public testing::Test {
protected:
    tests::TestSystem machine{base::Date{kNow}};
    tests::FakeFileManager files{machine.system};

    std::string entry(const std::string& name) const { return kStore + "/" + name; }
    void addEntry(const std::string& name, std::int64_t size, double age = 0)
    {
        files.addFile(entry(name), size, base::Date{kNow - age});
    }
    std::vector<std::string> said(Kind kind) const { return machine.log.texts(kind); }
};
