/// Puts back, in the end, which signals a thread blocks: a tool blocks some for good.
#pragma once

#include <csignal>

namespace tests {

class SignalMask {
public:
    SignalMask() { ::pthread_sigmask(SIG_SETMASK, nullptr, &m_before); }
    ~SignalMask() { ::pthread_sigmask(SIG_SETMASK, &m_before, nullptr); }
    SignalMask(const SignalMask&) = delete;
    SignalMask& operator=(const SignalMask&) = delete;

private:
    sigset_t m_before = {};
};

} // namespace tests
