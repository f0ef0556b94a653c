#pragma once

#include <QList>
#include <QMap>
#include <QSet>
#include <QString>
#include <QVariant>

// The cameras of one time card: camera entries (maps with "Name" and "GrpID")
// kept as the client or the server gave them, in order.
class CameraList
{
public:
    CameraList() = default;
    explicit CameraList(QList<QVariant> cameras) : m_cameras(std::move(cameras)) {}

    // A lone camera or a list of them, as the converter gives a repeated tag.
    static CameraList of(const QVariant &cameras);
    // The "Cam" entries under a time card's "CamList"; a lone empty "Cam" is
    // no camera.
    static CameraList onTimecard(const QMap<QString, QVariant> &timecard);

    // Appends every camera whose name the list does not hold yet: a camera
    // that stood twice would go on recording by the time card after one of
    // its entries is taken off.
    CameraList &merge(const QList<QVariant> &cameras);
    // Takes out every camera whose "Name" and "GrpID", read as text, equal
    // those of one of gone's: a group sent as the number 1 still meets "1".
    CameraList &remove(const QList<QVariant> &gone);

    QSet<QString> names() const;
    const QList<QVariant> &entries() const { return m_cameras; }

private:
    QList<QVariant> m_cameras;
};
