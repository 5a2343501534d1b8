#include <stdio.h>
#include <wireless.h>

int main(void) {
  WIRELESS_NETWORK network;
  if (MEROWirelessNetworkGet("Home", WIRELESS_FILTER_ESSID, &network) != 1) return 1;
  printf("%s on channel %d, %s\n", network.szEssid, network.channel, MEROWirelessProtocolStringGet(network.protocol));
  return 0;
}
