// What is on the disk when the power goes: a movie gets its name only when all of it is there.

#include "linux/photos/LibraryFixture.h"
#include "linux/photos/TracedPublisher.h"

#include <algorithm>
#include <sys/syscall.h>

namespace {

class APowerCut : public tests::LibraryFixture {
protected:
    using Calls = std::vector<tests::SystemCall>;

    /// What a whole save asks of the kernel, on this directory's file system.
    Calls callsOfASave(const std::vector<std::string>& options)
    {
        std::vector<std::string> words = options;
        words.insert(words.end(), {"--traced", source});
        tests::TracedPublisher publisher(words, {"HOME=" + home.path().native(), "TZ=UTC",
                                                 "ASAN_OPTIONS=detect_leaks=0", "TSAN_OPTIONS=report_bugs=0"});
        publisher.run(1'000'000);
        EXPECT_EQ(publisher.exitStatus(), 0);
        return publisher.calls();
    }

    template <typename Predicate> static std::ptrdiff_t placeOf(const Calls& calls, std::ptrdiff_t from, Predicate is)
    {
        return std::find_if(calls.begin() + from, calls.end(), is) - calls.begin();
    }
};

class APowerCutWith : public APowerCut, public testing::WithParamInterface<bool> {};

TEST_P(APowerCutWith, FindsEitherNoNameOrAWholeMovie)
{
    const Calls calls = callsOfASave(GetParam() ? std::vector<std::string>{"--hidden"} : std::vector<std::string>{});
    const auto end = static_cast<std::ptrdiff_t>(calls.size());
    const auto named =
        placeOf(calls, 0, [](const auto& call) { return call.number == SYS_linkat || call.number == SYS_renameat2; });
    ASSERT_LT(named, end) << "it gets a name";
    // The last bytes and the date are written to one file, which is flushed before that.
    const auto dated = placeOf(calls, 0, [](const auto& call) { return call.number == SYS_utimensat; });
    ASSERT_LT(dated, named);
    const int file = calls[static_cast<std::size_t>(dated)].first;
    const auto flushed =
        placeOf(calls, dated, [&](const auto& call) { return call.number == SYS_fsync && call.first == file; });
    EXPECT_LT(flushed, named) << "the name comes before the contents are safe";
    const auto written = placeOf(calls, flushed, [&](const auto& call) {
        return (call.number == SYS_write || call.number == SYS_pwrite64 || call.number == SYS_ioctl)
               && call.first == file;
    });
    EXPECT_GE(written, named) << "something is written behind the flush";
    // And the directory that it was given the name in, so that the name lasts when we say that the movie is saved.
    const int directory = calls[static_cast<std::size_t>(named)].third;
    const auto lasting =
        placeOf(calls, named, [&](const auto& call) { return call.number == SYS_fsync && call.first == directory; });
    // Another file has the same number later.
    const auto closed =
        placeOf(calls, named, [&](const auto& call) { return call.number == SYS_close && call.first == directory; });
    EXPECT_LT(lasting, closed) << "the name is not flushed";
}

INSTANTIATE_TEST_SUITE_P(FileSystems, APowerCutWith, testing::Bool(),
                         [](const auto& kind) { return kind.param ? "WithHiddenFiles" : "WithUnnamedFiles"; });

} // namespace
