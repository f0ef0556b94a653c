#pragma once

// The event triggers of the schedule document: each time card element with
// the document key that reflects it, in the order the document writes them.
// The first eleven are always written; the others only when the time card
// holds the element. The digital input ("DigiInput", "StopUntilDIFalling",
// "StopUntilDIRising") has keys of its own and is not listed here.
struct TriggerName
{
    const char *element;
    const char *key;
};

inline constexpr int AlwaysWrittenTriggers = 11;

inline constexpr TriggerName TriggerNames[] = {
    {"Motion", "motion"},
    {"PIR", "pir"},
    {"Tampering", "tampering"},
    {"PPTZTrigger", "pptz"},
    {"LineDetection", "lineDetection"},
    {"FieldDetection", "fieldDetection"},
    {"Loitering", "loitering"},
    {"CrowdDetection", "crowdDetection"},
    {"MissingObject", "missingObject"},
    {"AbandonObject", "abandonObject"},
    {"FaceDetection", "faceDetection"},
    {"ZoneDetection", "zoneDetection"},
    {"SmartTracking", "smartTracking"},
    {"RunningDetection", "runningDetection"},
    {"ParkingViolationDetection", "parkingViolationDetection"},
    {"RestrictedZoneDetection", "restrictedZoneDetection"},
    {"TemperatureThresholdWarning", "temperatureThresholdWarning"},
    {"TemperatureThresholdAlarm", "temperatureThresholdAlarm"},
    {"TemperatureDifferenceWarning", "temperatureDifferenceWarning"},
    {"TemperatureDifferenceAlarm", "temperatureDifferenceAlarm"},
    {"TemperatureRiseWarning", "temperatureRiseWarning"},
    {"TemperatureRiseAlarm", "temperatureRiseAlarm"},
    {"TemperatureSectionAlarm", "temperatureSectionAlarm"},
    {"ThermalIntrusion", "thermalIntrusion"},
    {"ThermalMultiLoitering", "thermalMultiLoitering"},
    {"FireSpotDetection", "fireSpotDetection"},
    {"SmokerDetection", "smokerDetection"},
    {"SmokeAndFlameDetection", "smokeAndFlameDetection"},
};
