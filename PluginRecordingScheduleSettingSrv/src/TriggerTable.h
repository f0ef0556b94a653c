#pragma once

#include <QLatin1String>

#include <array>

// The trigger elements of an event time frame, in the order the server
// expects them, each with the key of the client's trigger event object that
// stands for it. Composition writes every row; translation writes them back
// as the kind says.
struct TriggerRow
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

const std::array<TriggerRow, 32> &triggerRows();
