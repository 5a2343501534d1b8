// Whether the adapter is an access point's at this moment: every command that asks has its answer from here.
#ifndef MERO_TOOLS_AP_STATE_H
#define MERO_TOOLS_AP_STATE_H

enum class ApState {
  kOff,
  kDown,           // its daemon runs, and the interface is down
  kOffBySchedule,  // the same, since it has no hour on the air
  kSettingUp,
  kWaitingForRadar,  // listens whether its channel is a radar's, which takes a minute or more
  kOnAir,
};

// By the kernel and by the processes that run; the settings are not looked at, so a schedule is none of the answers.
ApState ReadApState();

// Whether there is an access point, on the air or not, or one is being set up: that is every state but kOff.
bool IsAccessPoints();

// Whether a process is setting an access point up. One that was killed leaves its marker behind.
bool IsBeingSetUp();

// Fails when the adapter is an access point's, or becomes one: joining a network would end that.
void RequireNoAccessPoint();

#endif  // MERO_TOOLS_AP_STATE_H
