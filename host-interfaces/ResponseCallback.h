#pragma once

#include <QString>
#include <QVariant>

#include <functional>

// The reply function of one request: (flag, result code "0" or "-1", text,
// data). A plug-in calls it once per request, possibly later and from the
// tunnel's thread.
using ResponseCallback = std::function<void(bool flag, const QString &resultCode,
                                            const QString &text, const QVariant &data)>;
