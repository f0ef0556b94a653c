// A time card's camera list: what merging a client's cameras into it and
// taking cameras off it leave on the time card.
#include "CameraList.h"
#include "RowName.h"

#include <QStringList>
#include <gtest/gtest.h>

namespace {

// "C_1/1 C_2/2": cameras by name and group; "#1" is a group sent as a number.
QList<QVariant> cameras(const char *text)
{
    QList<QVariant> list;
    for (const QString &camera : QString::fromLatin1(text).split(u' ', Qt::SkipEmptyParts)) {
        const QString name = camera.section(u'/', 0, 0);
        const QString group = camera.section(u'/', 1);
        list << QVariantMap{{"Name", name},
                            {"GrpID", group.startsWith(u'#') ? QVariant(group.mid(1).toInt())
                                                             : QVariant(group)}};
    }
    return list;
}

QString written(const CameraList &list)
{
    QStringList names;
    for (const QVariant &camera : list.entries()) {
        const QVariantMap entry = camera.toMap();
        names << entry.value("Name").toString() + u'/' + entry.value("GrpID").toString();
    }
    return names.join(u' ');
}

struct Row
{
    const char *name;
    const char *held;
    enum { Merge, Remove } operation;
    const char *given;
    const char *expected;
};

void PrintTo(const Row &row, std::ostream *os)
{
    *os << row.name;
}

class CameraListTest : public testing::TestWithParam<Row> {};

TEST_P(CameraListTest, LeavesTheExpectedCameras)
{
    const Row &row = GetParam();
    CameraList list(cameras(row.held));
    if (row.operation == Row::Merge)
        list.merge(cameras(row.given));
    else
        list.remove(cameras(row.given));
    EXPECT_EQ(written(list), QString::fromLatin1(row.expected));
}

const Row Rows[] = {
    {"a client naming a camera twice puts it on a new time card once", "", Row::Merge,
     "C_20/1 C_1/1 C_20/1", "C_20/1 C_1/1"},
    {"merging appends only cameras whose name is new", "C_3/1", Row::Merge, "C_1/2 C_3/2",
     "C_3/1 C_1/2"},
    {"merging nothing leaves the list as it was", "C_3/1 C_4/1", Row::Merge, "", "C_3/1 C_4/1"},
    {"removal matches name and group read as text", "C_1/1 C_2/2", Row::Remove, "C_1/#1",
     "C_2/2"},
    {"removal leaves a camera of another group", "C_1/1", Row::Remove, "C_1/2", "C_1/1"},
    {"removal takes out every entry of the camera", "C_1/1 C_2/1 C_1/1", Row::Remove, "C_1/1",
     "C_2/1"},
    {"removal compares whole names", "C_10/1", Row::Remove, "C_1/1", "C_10/1"},
};

INSTANTIATE_TEST_SUITE_P(Rows, CameraListTest, testing::ValuesIn(Rows), rowName<Row>);

} // namespace
