#pragma once

class IKoltTunnelClient;

// Services the host framework hands to a plug-in at initialisation.
class IFrameworkTools
{
public:
    virtual ~IFrameworkTools() = default;

    // The host's tunnel client, or null when there is none. Not owned by the
    // caller; it stays valid for the plug-in's lifetime.
    virtual IKoltTunnelClient *GetTunnelClient() = 0;
};
