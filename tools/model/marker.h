// The marker files of the library: each exists while it joins a network, or sets an access point up.
#ifndef MERO_TOOLS_MARKER_H
#define MERO_TOOLS_MARKER_H

// Whether a marker tells of work that is under way. An attempt that was cut off, as by a power cut, leaves its marker
// behind; such work does not last long, so an old marker tells of nothing. Nor does one that is not root's, since
// anyone may make files where they stand.
bool IsUnderWay(const char* szMarker);

#endif  // MERO_TOOLS_MARKER_H
