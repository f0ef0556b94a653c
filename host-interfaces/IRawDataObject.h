#pragma once

class QDataStream;

// An object that travels as QDataStream data between the host and its clients.
class IRawDataObject
{
public:
    virtual ~IRawDataObject() = default;
    virtual void ReadDataFromDataStream(QDataStream &stream) = 0;
    virtual void WriteDataToDataStream(QDataStream &stream) const = 0;
    // Not defaulted: that would make it noexcept, and every override with it.
    // NOLINTNEXTLINE(modernize-use-equals-default)
    virtual IRawDataObject &operator=(const IRawDataObject &) { return *this; }

protected:
    IRawDataObject() = default;
    IRawDataObject(const IRawDataObject &) = default;
};
