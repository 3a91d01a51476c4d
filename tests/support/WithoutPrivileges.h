/// While it lives, the super-user's right to read and write everything is put down: permissions count for this thread as
/// for anybody. Programs that are started from now on never get the right back. Does nothing for ordinary users.
#pragma once

#include <linux/capability.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace tests {

class WithoutPrivileges {
public:
    WithoutPrivileges()
    {
        ::syscall(SYS_capget, &m_header, m_before);
        __user_cap_data_struct reduced[2] = {m_before[0], m_before[1]};
        for (const unsigned right : {unsigned{CAP_DAC_OVERRIDE}, unsigned{CAP_DAC_READ_SEARCH}}) {
            ::prctl(PR_CAPBSET_DROP, right);
            reduced[0].effective &= ~(1U << right);
        }
        ::syscall(SYS_capset, &m_header, reduced);
    }
    ~WithoutPrivileges() { ::syscall(SYS_capset, &m_header, m_before); }
    WithoutPrivileges(const WithoutPrivileges&) = delete;
    WithoutPrivileges& operator=(const WithoutPrivileges&) = delete;

private:
    __user_cap_header_struct m_header{_LINUX_CAPABILITY_VERSION_3, 0};
    __user_cap_data_struct m_before[2] = {};
};

} // namespace tests
