/// GLib's references as owners. Any thread.
#pragma once

#include <glib-object.h>
#include <memory>
#include <string>

namespace appstream {

struct Unref {
    void operator()(gpointer object) const { g_object_unref(object); }
    void operator()(GPtrArray* array) const { g_ptr_array_unref(array); }
    void operator()(GMainContext* context) const { g_main_context_unref(context); }
};

/// Of an object, or an array, that we were given a reference of.
template <typename T> using Owned = std::unique_ptr<T, Unref>;

/// As a list of borrowed pointers.
template <typename T> class Elements {
public:
    explicit Elements(const GPtrArray* array) : m_array(array) {}
    T** begin() const { return m_array ? reinterpret_cast<T**>(m_array->pdata) : nullptr; }
    T** end() const { return m_array ? begin() + m_array->len : nullptr; }

private:
    const GPtrArray* m_array;
};

/// The error that a call may leave behind.
class Failure {
public:
    Failure() = default;
    ~Failure() { g_clear_error(&m_error); }
    Failure(const Failure&) = delete;
    Failure& operator=(const Failure&) = delete;

    /// For the call.
    GError** place() { return &m_error; }
    explicit operator bool() const { return m_error != nullptr; }
    /// Errors may come without a word.
    std::string description() const { return m_error && m_error->message ? m_error->message : "nobody says why"; }

private:
    GError* m_error = nullptr;
};

} // namespace appstream
