#pragma once

#include <QString>

#include <array>

// The trigger elements of an event time frame, in the order the server
// expects them, each with the key of the client's trigger event object that
// stands for it. Composition writes every row; translation writes them back
// as the kind says.
namespace Triggers {

using namespace Qt::Literals::StringLiterals;

struct Row
{
    enum Kind {
        Flag,         // "1" or "0" from the key; always in the client's document
        OptionalFlag, // as Flag, but in the document only when the time card has it
        StopFlag,     // as Flag, written after "di" in the document
        MotionCount,  // "ContMotNum": always "1", not in the document
        DigitalInput, // "DigiInput": the mask from "di" and the recording states
    };
    QLatin1String element;
    QLatin1String key;
    Kind kind;
};

inline constexpr std::array<Row, 32> Rows{{
    {"Motion"_L1, "motion"_L1, Row::Flag},
    {"ContMotNum"_L1, {}, Row::MotionCount},
    {"DigiInput"_L1, {}, Row::DigitalInput},
    {"PIR"_L1, "pir"_L1, Row::Flag},
    {"Tampering"_L1, "tampering"_L1, Row::Flag},
    {"PPTZTrigger"_L1, "pptz"_L1, Row::Flag},
    {"StopUntilDIFalling"_L1, "activatedToNormal"_L1, Row::StopFlag},
    {"StopUntilDIRising"_L1, "normalToActivated"_L1, Row::StopFlag},
    {"LineDetection"_L1, "lineDetection"_L1, Row::Flag},
    {"FieldDetection"_L1, "fieldDetection"_L1, Row::Flag},
    {"Loitering"_L1, "loitering"_L1, Row::Flag},
    {"CrowdDetection"_L1, "crowdDetection"_L1, Row::Flag},
    {"MissingObject"_L1, "missingObject"_L1, Row::Flag},
    {"AbandonObject"_L1, "abandonObject"_L1, Row::Flag},
    {"FaceDetection"_L1, "faceDetection"_L1, Row::Flag},
    {"ZoneDetection"_L1, "zoneDetection"_L1, Row::OptionalFlag},
    {"SmartTracking"_L1, "smartTracking"_L1, Row::OptionalFlag},
    {"RunningDetection"_L1, "runningDetection"_L1, Row::OptionalFlag},
    {"ParkingViolationDetection"_L1, "parkingViolationDetection"_L1, Row::OptionalFlag},
    {"RestrictedZoneDetection"_L1, "restrictedZoneDetection"_L1, Row::OptionalFlag},
    {"TemperatureThresholdWarning"_L1, "temperatureThresholdWarning"_L1, Row::OptionalFlag},
    {"TemperatureThresholdAlarm"_L1, "temperatureThresholdAlarm"_L1, Row::OptionalFlag},
    {"TemperatureDifferenceWarning"_L1, "temperatureDifferenceWarning"_L1, Row::OptionalFlag},
    {"TemperatureDifferenceAlarm"_L1, "temperatureDifferenceAlarm"_L1, Row::OptionalFlag},
    {"TemperatureRiseWarning"_L1, "temperatureRiseWarning"_L1, Row::OptionalFlag},
    {"TemperatureRiseAlarm"_L1, "temperatureRiseAlarm"_L1, Row::OptionalFlag},
    {"TemperatureSectionAlarm"_L1, "temperatureSectionAlarm"_L1, Row::OptionalFlag},
    {"ThermalIntrusion"_L1, "thermalIntrusion"_L1, Row::OptionalFlag},
    {"ThermalMultiLoitering"_L1, "thermalMultiLoitering"_L1, Row::OptionalFlag},
    {"FireSpotDetection"_L1, "fireSpotDetection"_L1, Row::OptionalFlag},
    {"SmokerDetection"_L1, "smokerDetection"_L1, Row::OptionalFlag},
    {"SmokeAndFlameDetection"_L1, "smokeAndFlameDetection"_L1, Row::OptionalFlag},
}};

} // namespace Triggers
