// Channels and their frequencies.
#ifndef MERO_COMMON_CHANNEL_H
#define MERO_COMMON_CHANNEL_H

// The number of the channel at a centre frequency; 0 when there is none.
constexpr int ChannelOf(unsigned megahertz) {
  struct Range {
    unsigned first, last, zero, step;
  };
  // `zero` is where channel 0 would be.
  constexpr Range kRanges[] = {
      {2412, 2472, 2407, 5},        // 2.4 GHz
      {2484, 2484, 2470, 1},        // its channel 14, which stands apart
      {4910, 4980, 4000, 5},        // 4.9 GHz
      {5005, 5920, 5000, 5},        // 5 GHz
      {5935, 5935, 5925, 5},        // channel 2 of 6 GHz, which stands apart
      {5955, 7115, 5950, 5},        // 6 GHz
      {58320, 70200, 56160, 2160},  // 60 GHz
  };
  for (const Range& range : kRanges) {
    if (megahertz >= range.first && megahertz <= range.last) {
      return static_cast<int>((megahertz - range.zero) / range.step);
    }
  }
  return 0;
}

#endif  // MERO_COMMON_CHANNEL_H
