#pragma once

#include "ServerCode.h"

#include <QString>

#include <optional>
#include <utility>

// Why a request was not carried out; code Ok means it was.
struct Refusal
{
    ServerCode code = ServerCode::Ok;
    QString reason;

    bool refused() const { return code != ServerCode::Ok; }
    // "code 4: <reason>", as the seeding commands report it.
    QString text() const { return QStringLiteral("code %1: %2").arg(serverCodeText(code), reason); }
};

// What a step of the server makes, or why it was refused. Built from a
// refusal only when something was refused.
template <typename T> class Result
{
public:
    Result(T value) : m_value(std::move(value)) {}
    Result(Refusal refusal) : m_refusal(std::move(refusal)) {}

    bool refused() const { return !m_value; }
    const Refusal &refusal() const { return m_refusal; }
    T &operator*() { return *m_value; }
    const T &operator*() const { return *m_value; }
    const T *operator->() const { return &*m_value; }

private:
    std::optional<T> m_value;
    Refusal m_refusal;
};
