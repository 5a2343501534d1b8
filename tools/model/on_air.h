// Whether the adapter is an access point's at this moment.
#ifndef MERO_TOOLS_ON_AIR_H
#define MERO_TOOLS_ON_AIR_H

// Whether the kernel says so, or the daemon that has just been started and is about to tell the kernel.
bool IsOnAir();

// Fails when the adapter is an access point's, or becomes one: joining a network would end that.
void RequireNoAccessPoint();

#endif  // MERO_TOOLS_ON_AIR_H
