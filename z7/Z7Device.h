// SPDX-License-Identifier: BSD-2-Clause
// The devices of Z7 boards, by kind.
#pragma once

#include "core/Object.h"

/// A `Z7Device` is a named resource of a board. Concrete devices implement the queries and set the
/// type; a query that a device cannot answer returns -1. Set the name and the type before other
/// threads see the device.
class KVLOAM_API Z7Device : public Object {
  public:
    static constexpr int kNameSize = 64;

    explicit Z7Device(char const* name);
    ~Z7Device() override;

    virtual int GetStatus() = 0;
    /// The index of the device's board, as its module numbers boards.
    virtual int GetBoardIndex() = 0;
    /// The device's number on its board, from 1.
    virtual int GetDeviceNumber() = 0;

    /// Copies at most `kNameSize` characters and fills the rest with zeros.
    /// Deliberate: a name of `kNameSize` characters or more has no terminator; read it with a
    /// bound.
    void SetName(char const* name);
    /// The name's `kNameSize` characters, owned by the device.
    char* GetName() { return m_name; }
    /// The device mapper's object type; -1 until the concrete device sets it.
    int GetType() const { return m_type; }

    static KVL::IID iid() { return KVL::IID("8Z7Device"); }

  private:
    char m_name[kNameSize];

  protected:
    int m_type = -1;
};

/// A `Z7VoiceDevice` is a pool of voice channels.
class KVLOAM_API Z7VoiceDevice : public Z7Device {
  public:
    explicit Z7VoiceDevice(char const* name);
    ~Z7VoiceDevice() override;

    virtual int GetCoderType() = 0;
    virtual int GetChannelState() = 0;
    virtual int GetGain() = 0; ///< dB
    /// 1 on, 2 off.
    virtual int GetEchoCancellation() = 0;

    static KVL::IID iid() { return KVL::IID("13Z7VoiceDevice"); }
};

/// A `Z7TRKDevice` is a digital trunk interface.
class KVLOAM_API Z7TRKDevice : public Z7Device {
  public:
    explicit Z7TRKDevice(char const* name);
    ~Z7TRKDevice() override;

    /// The number of its DS1 line on the board, from 1.
    virtual int GetLineNumber() = 0;
    /// DS1-MIB's dsx1LineType.
    virtual int GetLineType() = 0;
    /// DS1-MIB's dsx1LineStatus.
    virtual int GetLineStatus() = 0;
    virtual int GetProtocolType() = 0;

    static KVL::IID iid() { return KVL::IID("11Z7TRKDevice"); }
};

/// A `Z7ISDNDevice` is a digital trunk interface that carries ISDN.
class KVLOAM_API Z7ISDNDevice : public Z7TRKDevice {
  public:
    explicit Z7ISDNDevice(char const* name);
    ~Z7ISDNDevice() override;

    virtual int GetBChannelCount() = 0;
    /// An `ISDNDChannelStatusEnum`.
    virtual int GetDChannelStatus() = 0;

    static KVL::IID iid() { return KVL::IID("12Z7ISDNDevice"); }
};

/// A `Z7STNDevice` is a station or switching interface.
class KVLOAM_API Z7STNDevice : public Z7Device {
  public:
    explicit Z7STNDevice(char const* name);
    ~Z7STNDevice() override;

    virtual int GetTimeSlotCount() = 0;

    static KVL::IID iid() { return KVL::IID("11Z7STNDevice"); }
};
