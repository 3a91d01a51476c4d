// Who may name files: askers outside of sandboxes, as far as the kernel tells.
#include "linux/dbus/Asker.h"

#include "linux/posix/FileDescriptor.h"
#include "support/PrivateDirectory.h"
#include "support/WithoutPrivileges.h"

#include <gtest/gtest.h>

#include <csignal>
#include <fcntl.h>
#include <functional>
#include <sched.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

posix::FileDescriptor opened(const std::string& directory)
{
    return posix::FileDescriptor(::open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
}

/// Processes as /proc would show them.
class AnAsker : public ::testing::Test {
protected:
    AnAsker()
    {
        for (const char* name : {"they", "we"}) {
            m_directory.write(std::string(name) + "/cgroup", "0::/user.slice/app.slice/app-racer.scope\n");
            m_directory.write(std::string(name) + "/attr/current", "unconfined\n");
            link(name, "root", "root");
            link(name, "ns/mnt", "mounts");
        }
        std::filesystem::create_directory(m_directory.path() / "root");
        m_directory.write("mounts", "");
    }

    /// What `process` has as `name` is what lies at `target`.
    void link(const std::string& process, const std::string& name, const std::string& target)
    {
        const auto path = m_directory.path() / process / name;
        std::filesystem::create_directories(path.parent_path());
        std::filesystem::remove(path);
        std::filesystem::create_symlink(m_directory.path() / target, path);
    }

    bool isConfined(const std::string& label = "unconfined")
    {
        return dbus::isConfined({opened(m_directory.path() / "they"), label}, m_directory.path() / "we");
    }

    tests::PrivateDirectory m_directory;
};

TEST_F(AnAsker, IsFreeWhoSeesWhatWeSee)
{
    EXPECT_FALSE(isConfined());
    EXPECT_FALSE(isConfined(""));
    EXPECT_FALSE(isConfined("unconfined_u:unconfined_r:unconfined_t:s0"));
    EXPECT_FALSE(isConfined("racer (complain)"));
}

TEST_F(AnAsker, IsConfinedWhoIsNotKnown)
{
    EXPECT_TRUE(dbus::isConfined(dbus::Asker(), m_directory.path() / "we"));
    EXPECT_TRUE(dbus::isConfined({opened(m_directory.path() / "they"), ""}, m_directory.path() / "nowhere"));
}

TEST_F(AnAsker, IsConfinedByALabelThatWeDoNotHave)
{
    for (const char* label : {"snap.racer.racer (enforce)", "snap.racer.racer (complain)", "racer (enforce)"})
        EXPECT_TRUE(isConfined(label)) << label;
    EXPECT_FALSE(isConfined("racer (enforced)"));
    m_directory.write("we/attr/current", "racer (enforce)\n");
    EXPECT_FALSE(isConfined("racer (enforce)")) << "a container holds both of us";
    m_directory.write("we/attr/current", std::string("racer (enforce)\0", 16));
    EXPECT_FALSE(isConfined("racer (enforce)"));
    EXPECT_TRUE(isConfined("other (enforce)"));
    std::filesystem::remove(m_directory.path() / "we/attr/current");
    EXPECT_TRUE(isConfined("racer (enforce)"));
}

TEST_F(AnAsker, IsConfinedInTheControlGroupOfAPackage)
{
    m_directory.write("they/cgroup", "1:name=systemd:/\n0::/user.slice/snap.racer.racer-1f.scope\n");
    EXPECT_TRUE(isConfined());
    m_directory.write("they/cgroup", std::string(5000, 'x') + "\n0::/snap.racer.racer-1f.scope\n");
    EXPECT_TRUE(isConfined()) << "however many others there are";
    m_directory.write("they/cgroup", "0::/system.slice/snapd.service\n");
    EXPECT_FALSE(isConfined());
    std::filesystem::remove(m_directory.path() / "they/cgroup");
    EXPECT_TRUE(isConfined()) << "it cannot be looked at";
    std::filesystem::create_directory(m_directory.path() / "they/cgroup");
    EXPECT_TRUE(isConfined()) << "it cannot be read";
}

TEST_F(AnAsker, IsConfinedWhereItSeesOtherMounts)
{
    m_directory.write("other mounts", "");
    link("they", "ns/mnt", "other mounts");
    EXPECT_TRUE(isConfined());
    link("they", "ns/mnt", "no mounts");
    EXPECT_TRUE(isConfined()) << "it cannot be looked at";
    link("they", "ns/mnt", "mounts");
    link("we", "ns/mnt", "no mounts");
    EXPECT_TRUE(isConfined());
}

TEST_F(AnAsker, IsConfinedWhereItHasAnotherRoot)
{
    std::filesystem::create_directory(m_directory.path() / "other root");
    link("they", "root", "other root");
    EXPECT_TRUE(isConfined());
    link("they", "root", "no root");
    EXPECT_TRUE(isConfined()) << "it cannot be looked at";
    link("they", "root", "root");
    link("we", "root", "no root");
    EXPECT_TRUE(isConfined());
}

TEST_F(AnAsker, IsConfinedInASandboxThatWeAreInAsWell)
{
    m_directory.write("root/.flatpak-info", "[Application]\n");
    EXPECT_TRUE(isConfined());
    std::filesystem::remove(m_directory.path() / "root/.flatpak-info");
    std::filesystem::create_symlink("nowhere", m_directory.path() / "root/.flatpak-info");
    EXPECT_TRUE(isConfined()) << "whatever it is";
    std::filesystem::remove(m_directory.path() / "root/.flatpak-info");
    EXPECT_FALSE(isConfined());
    ::chmod((m_directory.path() / "root").c_str(), 0);
    const tests::WithoutPrivileges withoutPrivileges;
    EXPECT_TRUE(isConfined()) << "it cannot be looked at";
}

/// A real process, which does something and then stays until it is asked.
class Process {
public:
    explicit Process(const std::function<bool()>& first = [] { return true; })
    {
        int ends[2] = {};
        EXPECT_EQ(::pipe2(ends, O_CLOEXEC), 0);
        m_process = ::fork();
        if (m_process == 0) {
            const char done = first() ? 'y' : 'n';
            if (::write(ends[1], &done, 1) == 1 && done == 'y')
                ::pause();
            ::_exit(0);
        }
        ::close(ends[1]);
        char done = 'n';
        m_isReady = ::read(ends[0], &done, 1) == 1 && done == 'y';
        ::close(ends[0]);
    }
    ~Process()
    {
        end();
        ::waitpid(m_process, nullptr, 0);
    }
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    /// Leaves a process behind that nobody has waited for.
    void end()
    {
        ::kill(m_process, SIGKILL);
        siginfo_t ended = {};
        ::waitid(P_PID, static_cast<id_t>(m_process), &ended, WEXITED | WNOWAIT);
    }

    bool isReady() const { return m_isReady; }
    dbus::Asker asker() const { return {opened("/proc/" + std::to_string(m_process)), ""}; }

private:
    pid_t m_process = -1;
    bool m_isReady = false;
};

TEST(ARealAsker, IsFreeAsOurChild)
{
    const Process process;
    EXPECT_FALSE(dbus::isConfined(process.asker()));
    EXPECT_FALSE(dbus::isConfined({opened("/proc/self"), ""}));
}

TEST(ARealAsker, IsConfinedWithAnotherRoot)
{
    const tests::PrivateDirectory root;
    root.write(".flatpak-info", "[Application]\n");
    const Process process([&] {
        const auto change = [&] { return ::chroot(root.path().c_str()) == 0 && ::chdir("/") == 0; };
        return change() || (::unshare(CLONE_NEWUSER) == 0 && change());
    });
    ASSERT_TRUE(process.isReady()) << "a process can change its root as root, or in a namespace of its own";
    EXPECT_TRUE(dbus::isConfined(process.asker()));
}

TEST(ARealAsker, IsConfinedWithMountsOfItsOwn)
{
    const Process process([] { return ::unshare(CLONE_NEWNS) == 0 || ::unshare(CLONE_NEWUSER | CLONE_NEWNS) == 0; });
    ASSERT_TRUE(process.isReady()) << "a process can have mounts of its own as root, or in a namespace of its own";
    EXPECT_TRUE(dbus::isConfined(process.asker()));
}

TEST(ARealAsker, IsConfinedOnceItHasEnded)
{
    Process process;
    const dbus::Asker asker = process.asker();
    process.end();
    EXPECT_TRUE(dbus::isConfined(asker)) << "its number is not free yet";
    dbus::Asker gone;
    {
        const Process other;
        gone = other.asker();
        EXPECT_TRUE(gone.process);
    }
    EXPECT_TRUE(dbus::isConfined(gone));
}

} // namespace
