/* A management program in plain C: keeps networks, lists them, and gives back what it was given. */
#define _XOPEN_SOURCE 700 /* remque() */

#include <search.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include "platform.h"
#include "wireless.h"

#define REQUIRE(condition) require((condition) != 0, #condition, __LINE__)

static void require(int holds, const char* condition, int line) {
  if (holds) return;
  fprintf(stderr, "line %d: %s does not hold\n", line, condition);
  exit(EXIT_FAILURE);
}

static WIRELESS_NETWORK_CONFIG network(const char* name, unsigned char last) {
  WIRELESS_NETWORK_CONFIG config = {.szKey = "secret", .network = {.opmode = WIRELESS_OPMODE_MANAGED}};
  config.network.auth = WIRELESS_AUTH_WPA2PSK;
  config.network.encrypt = WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES;
  config.network.bssid[5] = last;
  strcpy(config.network.szEssid, name);
  return config;
}

/* Frees the list and counts what was in it. */
static int drain(WIRELESS_LIST* head) {
  int count = 0;
  while (head->q_forw != head) {
    WIRELESS_LIST* node = head->q_forw;
    WIRELESS_NETWORK_CONFIG* config = (WIRELESS_NETWORK_CONFIG*)((char*)node - offsetof(WIRELESS_NETWORK_CONFIG, list));
    REQUIRE(config->network.encrypt == 12);
    REQUIRE(config->atime > 0);
    remque(node);
    free(config);
    ++count;
  }
  return count;
}

static void keep_networks(void) {
  const WIRELESS_NETWORK_CONFIG home = network("Home", 1);
  const WIRELESS_NETWORK_CONFIG cafe = network("Cafe", 2);
  WIRELESS_LIST head;
  REQUIRE(MEROWirelessConfSet(&home) == 0);
  REQUIRE(MEROWirelessConfSet(&cafe) == 0);
  REQUIRE(MEROWirelessConfSet(NULL) == -1);
  REQUIRE(MEROWirelessConfEnum(&head) == 0);
  REQUIRE(drain(&head) == 2);
  REQUIRE(MEROWirelessConfEnumByAtime(&head) == 0);
  REQUIRE(drain(&head) == 2);
}

static void use_texts(void) {
  PPLIBSZHASH hash = PLIBCSzHashAlloc(1024);
  PPLIBSZLIST list = PLIBCSzListAlloc(1024);
  REQUIRE(PLIBCSzHashSetValue(&hash, "key", "value") > 0);
  REQUIRE(strcmp(PLIBCSzHashGetValue(hash, "key"), "value") == 0);
  REQUIRE(PLIBCFileEnumSection("/usr/mero/etc/wireless.conf", &list) == 2);
  REQUIRE(list->nItem == 2);
  REQUIRE(strcmp(PLIBCSzListGet(list, 1), "00:00:00:00:00:02") == 0);
  PLIBCSzListFree(list);
  PLIBCSzHashFree(hash);
  REQUIRE(strcmp(MEROWirelessProtocolStringGet(WIRELESS_PROTO_11BGN), "11b/g/n") == 0);
  REQUIRE(MERONetIsSameSubnet("10.1.14.2", "10.1.14.1", "255.255.255.0") == 1);
}

int main(void) {
  keep_networks();
  use_texts();
  return EXIT_SUCCESS;
}
