// Whether somebody has disconnected the appliance, who wants it to stay so.
#ifndef MERO_TOOLS_LEFT_ALONE_H
#define MERO_TOOLS_LEFT_ALONE_H

// Takes a note of that, which holds until it is forgotten or the appliance starts anew; fails when it cannot be taken.
// Forgetting one that is not there does nothing. Both are for whoever holds a JoinLock.
void LeaveAlone();
void LeaveAloneNoMore();

// Whether the note holds. It does not where a network was joined since, by another program say.
bool IsLeftAlone();

#endif  // MERO_TOOLS_LEFT_ALONE_H
