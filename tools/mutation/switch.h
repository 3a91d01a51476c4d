/// Included first by sources that tools/mutate has broken: which of their mutants is on, and which were reached.
#pragma once

#include <cstdlib>
#include <fcntl.h>
#include <memory>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

namespace mutation {

/// One byte a mutant, in the file of CLIPSA_MUTANTS_REACHED: shared, so that killed programs and children tell, too.
inline unsigned char* reachedMutants()
{
    const char* path = std::getenv("CLIPSA_MUTANTS_REACHED");
    if (!path)
        return nullptr;
    const int file = ::open(path, O_RDWR | O_CLOEXEC);
    struct stat status = {};
    if (file < 0 || ::fstat(file, &status) != 0)
        return nullptr;
    void* bytes =
        ::mmap(nullptr, static_cast<std::size_t>(status.st_size), PROT_READ | PROT_WRITE, MAP_SHARED, file, 0);
    ::close(file);
    return bytes == MAP_FAILED ? nullptr : static_cast<unsigned char*>(bytes);
}

/// Whether this mutant, and with it no other, is to be run. Any thread.
inline bool isOn(int mutant)
{
    static unsigned char* const reached = reachedMutants();
    static const int chosen = std::getenv("CLIPSA_MUTANT") ? std::atoi(std::getenv("CLIPSA_MUTANT")) : -1;
    if (reached)
        reached[mutant] = 1;
    return mutant == chosen;
}

/// What a weak reference that was made strong holds.
template <class T> std::shared_ptr<T> held(int mutant, const std::weak_ptr<T>& object)
{
    return isOn(mutant) ? object.lock() : nullptr;
}

} // namespace mutation
