#include "TriggerTable.h"

const std::array<TriggerRow, 32> &triggerRows()
{
    using L = QLatin1String;
    static const std::array<TriggerRow, 32> rows{{
        {L("Motion"), L("motion"), TriggerRow::Flag},
        {L("ContMotNum"), L(), TriggerRow::MotionCount},
        {L("DigiInput"), L(), TriggerRow::DigitalInput},
        {L("PIR"), L("pir"), TriggerRow::Flag},
        {L("Tampering"), L("tampering"), TriggerRow::Flag},
        {L("PPTZTrigger"), L("pptz"), TriggerRow::Flag},
        {L("StopUntilDIFalling"), L("activatedToNormal"), TriggerRow::StopFlag},
        {L("StopUntilDIRising"), L("normalToActivated"), TriggerRow::StopFlag},
        {L("LineDetection"), L("lineDetection"), TriggerRow::Flag},
        {L("FieldDetection"), L("fieldDetection"), TriggerRow::Flag},
        {L("Loitering"), L("loitering"), TriggerRow::Flag},
        {L("CrowdDetection"), L("crowdDetection"), TriggerRow::Flag},
        {L("MissingObject"), L("missingObject"), TriggerRow::Flag},
        {L("AbandonObject"), L("abandonObject"), TriggerRow::Flag},
        {L("FaceDetection"), L("faceDetection"), TriggerRow::Flag},
        {L("ZoneDetection"), L("zoneDetection"), TriggerRow::OptionalFlag},
        {L("SmartTracking"), L("smartTracking"), TriggerRow::OptionalFlag},
        {L("RunningDetection"), L("runningDetection"), TriggerRow::OptionalFlag},
        {L("ParkingViolationDetection"), L("parkingViolationDetection"), TriggerRow::OptionalFlag},
        {L("RestrictedZoneDetection"), L("restrictedZoneDetection"), TriggerRow::OptionalFlag},
        {L("TemperatureThresholdWarning"), L("temperatureThresholdWarning"),
         TriggerRow::OptionalFlag},
        {L("TemperatureThresholdAlarm"), L("temperatureThresholdAlarm"), TriggerRow::OptionalFlag},
        {L("TemperatureDifferenceWarning"), L("temperatureDifferenceWarning"),
         TriggerRow::OptionalFlag},
        {L("TemperatureDifferenceAlarm"), L("temperatureDifferenceAlarm"),
         TriggerRow::OptionalFlag},
        {L("TemperatureRiseWarning"), L("temperatureRiseWarning"), TriggerRow::OptionalFlag},
        {L("TemperatureRiseAlarm"), L("temperatureRiseAlarm"), TriggerRow::OptionalFlag},
        {L("TemperatureSectionAlarm"), L("temperatureSectionAlarm"), TriggerRow::OptionalFlag},
        {L("ThermalIntrusion"), L("thermalIntrusion"), TriggerRow::OptionalFlag},
        {L("ThermalMultiLoitering"), L("thermalMultiLoitering"), TriggerRow::OptionalFlag},
        {L("FireSpotDetection"), L("fireSpotDetection"), TriggerRow::OptionalFlag},
        {L("SmokerDetection"), L("smokerDetection"), TriggerRow::OptionalFlag},
        {L("SmokeAndFlameDetection"), L("smokeAndFlameDetection"), TriggerRow::OptionalFlag},
    }};
    return rows;
}
