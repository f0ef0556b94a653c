// Worked examples of the time card messages, byte for byte as the plug-in
// sends them through the local tunnel (read back from the exchange log).

#include "HostProcess.h"

#include <QCoreApplication>
#include <QJsonArray>
#include <QJsonDocument>

namespace {

const char *const Period = "<Range><Period><TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 "
                           "00:00:00.000</TmE></Period><End>false</End></Range>"
                           "<RepeatFreq>1</RepeatFreq>";

// One frame on days 1 to 5 from 08:00 to 18:00, mode Continuous.
QString lobbyMapping()
{
    return QStringLiteral("<Mapping><Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay"
                          "</DLMod><RepeatMod>Weekly</RepeatMod><DayList><Ele B=\"1.0\"/><Ele "
                          "B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"4.0\"/><Ele B=\"5.0\"/></DayList>"
                          "<Intervals><Ele B=\"28800\" E=\"64800\"/></Intervals><Holiday>false"
                          "</Holiday>%1</Frame><RecMode>Continuous</RecMode></Ele></Mapping>")
        .arg(QString::fromLatin1(Period));
}

QString defaultContinuousMapping()
{
    return QStringLiteral(
               "<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</"
               "RepeatMod>"
               "<DLMod>SingleDay</DLMod><Intervals><Ele B=\"0\" E=\"86400\"/></Intervals><DayList>"
               "<Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"4.0\"/><Ele B=\"5.0\"/>"
               "<Ele B=\"6.0\"/><Ele B=\"7.0\"/></DayList>%1</Frame><RecMode>Continuous</RecMode>"
               "<AllEvent>true</AllEvent><Motion>true</Motion><ContMotNum>1</ContMotNum>"
               "<DigiInput>3</DigiInput></Ele>")
        .arg(QString::fromLatin1(Period));
}

const QString LobbyDocument = QStringLiteral(
    R"({"Rectangles":[{"Bottom":18,"Left":0,"RecordingMode":"Continuous","Right":5,"Top":8}]})");

QString payload(const QJsonObject &object)
{
    return QString::fromUtf8(QJsonDocument(object).toJson(QJsonDocument::Compact));
}

QJsonArray cameras(const char *name, const char *group)
{
    return {QJsonObject{{QStringLiteral("Name"), QString::fromLatin1(name)},
                        {QStringLiteral("GrpID"), QString::fromLatin1(group)}}};
}

class Example : public HostProcess
{
protected:
    // The body of the one exchange with this command.
    QString bodyOf(const QString &command)
    {
        QStringList bodies;
        for (const QJsonObject &exchange : exchanges()) {
            if (exchange.value(QStringLiteral("command")).toString() == command)
                bodies << exchange.value(QStringLiteral("body")).toString();
        }
        EXPECT_EQ(bodies.size(), 1) << command.toStdString();
        return bodies.value(0);
    }
};

TEST_F(Example, LobbyWithoutCamerasHasNoCameraList)
{
    seed();
    const Run run = host({QStringLiteral("request"), QStringLiteral("AddSchedule"),
                          payload({{QStringLiteral("ScheduleName"), QStringLiteral("Lobby")},
                                   {QStringLiteral("timeframes"), LobbyDocument}})});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(bodyOf(QStringLiteral("InsRecTmcard")),
              QStringLiteral("<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID>"
                             "<Name>Lobby</Name>") +
                  lobbyMapping() + QStringLiteral("</Tmcard></InsRecTmcard>"));
}

TEST_F(Example, LobbyFrameWithCameraC12InGroup3)
{
    // The customised time card is missing from the seed, so it is created
    // with the frame and the camera.
    seed();
    const Run run = host({QStringLiteral("request"), QStringLiteral("CustomizeSchedule"),
                          payload({{QStringLiteral("timeframes"), LobbyDocument},
                                   {QStringLiteral("camRecGroupList"), cameras("C_12", "3")}})});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(bodyOf(QStringLiteral("InsRecTmcard")),
              QStringLiteral("<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID>"
                             "<Name>KOLT2 Customize Recording</Name>") +
                  lobbyMapping() +
                  QStringLiteral("<CamList><Cam><Name>C_12</Name><RecGrpID>3</RecGrpID></Cam>"
                                 "</CamList></Tmcard></InsRecTmcard>"));
}

TEST_F(Example, DefaultContinuousUpdateListsTheNewCameraFirst)
{
    // The seed's time card 2 is the default continuous one, at revision 5
    // with C_1 in group 1.
    seed();
    const Run run = host({QStringLiteral("request"), QStringLiteral("DefaultContinousSchedule"),
                          payload({{QStringLiteral("camRecGroupList"), cameras("C_7", "2")}})});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(bodyOf(QStringLiteral("UpdRecTmcard")),
              QStringLiteral("<UpdRecTmcard><Tmcard><Revision>5</Revision><TmcardID>2</TmcardID>"
                             "<Name>KOLT2 Default Continuous Recording</Name><Mapping>") +
                  defaultContinuousMapping() +
                  QStringLiteral("</Mapping><CamList><Cam><Name>C_7</Name><RecGrpID>2</RecGrpID>"
                                 "</Cam><Cam><Name>C_1</Name><RecGrpID>1</RecGrpID></Cam>"
                                 "</CamList></Tmcard></UpdRecTmcard>"));
    EXPECT_EQ(bodyOf(QStringLiteral("GetRecTmcard")),
              QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>"));
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}
