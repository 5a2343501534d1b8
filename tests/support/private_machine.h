// A machine of the test's own: its files and network interfaces are the real ones to whoever runs in it, and nothing of
// the machine outside is touched.
#ifndef MERO_TESTS_PRIVATE_MACHINE_H
#define MERO_TESTS_PRIVATE_MACHINE_H

// Moves this process into namespaces in which /etc, /run, /tmp, /usr and /var may be written to, on top of what the
// machine has, and in which there are no network interfaces but a loopback. /usr/mero/etc and /var/tmp exist, and
// nothing of an appliance that the machine outside may be. The mask of modes is 022, the language English. The files
// that this machine has and the one outside has not stand in /mnt, in a directory for each of the five. Ends the
// process with a message when that cannot be done.
void EnterPrivateMachine();

#endif  // MERO_TESTS_PRIVATE_MACHINE_H
