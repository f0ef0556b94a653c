#pragma once

#include "IFrameworkTools.h"

// The local host's framework: hands the plug-in the tunnel it was made with.
// The tunnel is not owned; whoever made both keeps it alive longer than any
// plug-in that was given it.
class LocalFrameworkTools final : public IFrameworkTools
{
public:
    explicit LocalFrameworkTools(IKoltTunnelClient *tunnel) : m_tunnel(tunnel) {}

    IKoltTunnelClient *GetTunnelClient() override { return m_tunnel; }

private:
    IKoltTunnelClient *m_tunnel;
};
