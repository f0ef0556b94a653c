#pragma once

#include <QString>

#include <optional>
#include <utility>

// Why a step of plugin-host failed: the message for standard error.
struct Failure
{
    QString message;
};

// What a step makes, or why it failed.
template <class T> class HostResult
{
public:
    HostResult(T value) : m_value(std::move(value)) {}
    HostResult(Failure failure) : m_failure(std::move(failure)) {}

    explicit operator bool() const { return m_value.has_value(); }
    T &operator*() { return *m_value; }
    const T &operator*() const { return *m_value; }
    T *operator->() { return &*m_value; }
    const T *operator->() const { return &*m_value; }
    const QString &error() const { return m_failure.message; }

private:
    std::optional<T> m_value;
    Failure m_failure;
};
