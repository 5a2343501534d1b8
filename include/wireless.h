/**
 * @file wireless.h
 * Wireless networking of the appliance: one adapter, as a client or as an access point.
 *
 * What holds for every function below:
 *
 *  1. Text is a run of bytes that ends with NUL, in no particular encoding: network names are up to 32 arbitrary
 *     bytes, and are compared and stored as bytes. A text that does not fit a field is cut and still terminated.
 *  2. Every function works synchronously in the caller's process, tells what it blocks on (the disk, another writer's
 *     lock, the adapter, a DHCP server, a script of the appliance) and for how long at most where that is bounded, and
 *     keeps nothing in memory between calls. All state is in files, and in the system's own network configuration. A
 *     time that a function tells is that of commands that work: one that never ends is waited for without end.
 *  3. A function that returns `int` gives 0 on success and -1 on failure unless it says otherwise; one that returns
 *     BOOL gives exactly TRUE or FALSE. A null pointer where a value is required is a failure, never a crash, unless
 *     a function says otherwise.
 *  4. Every failure is reported to syslog at LOG_ERR, where it is found, as "unit:line message". Some progress is
 *     reported the same way.
 *  5. Records belong to whoever allocated them; lists belong to the caller (see WIRELESS_LIST). Texts that are
 *     returned are constants: do not free or change them.
 *  6. The caller runs with the rights of the network administrator (root on the appliance).
 *  7. The caller must not ignore SIGCHLD, since commands are run and waited for, and must not call from two threads
 *     at once. Calls from separate processes are safe wherever files are concerned.
 *
 * The header is usable from C99 and from C++11 on; every enumeration is a signed 32-bit integer in both.
 */
#ifndef MERO_WIRELESS_H
#define MERO_WIRELESS_H

#include <stddef.h>
#include <stdint.h>

/* Every enumeration is an int32_t; C, which leaves the type of an `enum` to the compiler, has it as a typedef. */
#ifdef __cplusplus
#define MERO_INT32 : int32_t
#else
#define MERO_INT32
typedef int32_t BOOL;
typedef int32_t WIRELESS_PROTOCOL;
typedef int32_t WIRELESS_AUTH;
typedef int32_t WIRELESS_ENCRYPT;
typedef int32_t WIRELESS_OPMODE;
typedef int32_t WIRELESS_SCAN;
typedef int32_t WIRELESS_FILTER;
typedef int32_t WIRELESS_STATUS;
typedef int32_t WIRELESS_REQUEST;
typedef int32_t MERO_WIRELESS_MODE;
typedef int32_t MERO_AP_ENCRYPT;
typedef int32_t MERO_AP_WPA_PSK_TYPE;
typedef int32_t MERO_AP_MODE;
typedef int32_t MERO_AP_FREQ;
typedef int32_t MERO_AP_WPA_ENCRYPT_TYPE;
#endif

#pragma GCC visibility push(default)

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Types ---------------------------------------------------------------------------------------------------- */

/** A truth value. */
enum BOOL MERO_INT32 { FALSE = 0, TRUE = 1 };

/** The radio standards that a network speaks; MEROWirelessProtocolStringGet() gives the text. */
enum WIRELESS_PROTOCOL MERO_INT32 {
  WIRELESS_PROTO_UNKNOWN = 0,
  WIRELESS_PROTO_LEGACY_11BG = 1,
  WIRELESS_PROTO_LEGACY_11B = 2,
  WIRELESS_PROTO_LEGACY_11A = 3,
  WIRELESS_PROTO_LEGACY_11ABG = 4,
  WIRELESS_PROTO_LEGACY_11G = 5,
  WIRELESS_PROTO_11ABGN = 6,
  WIRELESS_PROTO_11N = 7,
  WIRELESS_PROTO_11GN = 8,
  WIRELESS_PROTO_11AN = 9,
  WIRELESS_PROTO_11BGN = 10,
  WIRELESS_PROTO_11AGN = 11,
  WIRELESS_PROTO_11BN = 12,
};

/** How stations prove themselves to a network. */
enum WIRELESS_AUTH MERO_INT32 {
  WIRELESS_AUTH_UNKNOWN = 0,
  WIRELESS_AUTH_OPEN = 1,
  WIRELESS_AUTH_SHARED = 2,  /**< WEP shared key; what a scan reports for every WEP network */
  WIRELESS_AUTH_WEPAUTO = 3, /**< WEP, open or shared key, whichever the network wants */
  WIRELESS_AUTH_WPAPSK = 4,
  WIRELESS_AUTH_WPA2PSK = 5, /**< also a network that offers WPA and WPA2 */
  WIRELESS_AUTH_WPANONE = 6,
  WIRELESS_AUTH_WPAEAP = 7,
  WIRELESS_AUTH_WPA2EAP = 8,
};

/** How a network encrypts: single bits, combined. TKIP and AES together are 12; 0 is unknown, which is not "none". */
enum WIRELESS_ENCRYPT MERO_INT32 {
  WIRELESS_ENCRYPT_UNKNOWN = 0,
  WIRELESS_ENCRYPT_NONE = 1,
  WIRELESS_ENCRYPT_WEP = 2,
  WIRELESS_ENCRYPT_TKIP = 4,
  WIRELESS_ENCRYPT_AES = 8,
};

/** What an interface or a network is operated as. */
enum WIRELESS_OPMODE MERO_INT32 {
  WIRELESS_OPMODE_AUTO = 0,
  WIRELESS_OPMODE_ADHOC = 1,   /**< a cell of equals, without an access point */
  WIRELESS_OPMODE_MANAGED = 2, /**< a station of an access point */
  WIRELESS_OPMODE_MASTER = 3,  /**< an access point */
  WIRELESS_OPMODE_REPEATER = 4,
  WIRELESS_OPMODE_SECONDEARY = 5,
  WIRELESS_OPMODE_MONITOR = 6,
  WIRELESS_OPMODE_UNKNOWN = 7,
  WIRELESS_OPMODE_MAX = 8, /**< the number of modes above, no mode itself */
};

/** How a scan is made. */
enum WIRELESS_SCAN MERO_INT32 {
  WIRELESS_SCAN_LAST = 0,  /**< read what the adapter's last scan found */
  WIRELESS_SCAN_RENEW = 1, /**< scan afresh first */
};

/** What a network is looked up by. */
enum WIRELESS_FILTER MERO_INT32 {
  WIRELESS_FILTER_ESSID = 0, /**< its name */
  WIRELESS_FILTER_BSSID = 1, /**< the hardware address of its access point */
};

/** The state of the adapter's connection. */
enum WIRELESS_STATUS MERO_INT32 {
  WIRELESS_STATUS_UNKNOWN = 0,
  WIRELESS_STATUS_NOT_SUPPORTED = 1,
  WIRELESS_STATUS_NO_ADAPTER = 2,
  WIRELESS_STATUS_DOWN = 3,
  WIRELESS_STATUS_DISCONNECTED = 4,
  WIRELESS_STATUS_CONNECTED_MANAGED = 5,
  WIRELESS_STATUS_CONNECTED_ADHOC = 6,
  WIRELESS_STATUS_MONITOR = 7,
};

/** What is asked about the current connection, and thereby which member of WIRELESS_INFO answers. */
enum WIRELESS_REQUEST MERO_INT32 {
  REQUEST_ESSID = 0,
  REQUEST_PROTOCOL = 1,
  REQUEST_AUTH = 2,
  REQUEST_MODE = 3,
  REQUEST_STATUS = 4,
};

/** What the one adapter is used for. */
enum MERO_WIRELESS_MODE MERO_INT32 {
  WIRELESS_AP_MODE = 0,
  WIRELESS_CLIENT_MODE = 1,
};

/** How an access point protects its network. */
enum MERO_AP_ENCRYPT MERO_INT32 {
  AP_ENCRYPT_OPEN = 0,
  AP_ENCRYPT_WEP = 1,
  AP_ENCRYPT_WPA_PSK = 2,
  AP_ENCRYPT_WPA_EAP = 3,
  AP_ENCRYPT_MAX = 4, /**< the number of kinds above, no kind itself */
};

/** The generation of WPA that an access point offers. */
enum MERO_AP_WPA_PSK_TYPE MERO_INT32 {
  TYPE_WPA = 1,
  TYPE_WPA2 = 2,
};

/** The radio standards of an access point: single bits, combined. */
enum MERO_AP_MODE MERO_INT32 {
  AP_MODE_80211A = 1,
  AP_MODE_80211B = 2,
  AP_MODE_80211G = 4,
  AP_MODE_80211N = 8,
};

/** The channel widths that an access point may use: single bits, combined. */
enum MERO_AP_FREQ MERO_INT32 {
  AP_FREQ_20_MHZ = 1,
  AP_FREQ_40_MHZ = 2,
  AP_FREQ_ALL = 3,
};

/** The ciphers that an access point offers under WPA. */
enum MERO_AP_WPA_ENCRYPT_TYPE MERO_INT32 {
  TYPE_TKIP = 1,
  TYPE_CCMP = 2,
  TYPE_TKIP_CCMP = 3,
};

/**
 * A node of a list of records, embedded in each record.
 *
 * A list is a ring around a head that the caller owns; an empty list is a head whose two pointers point at itself.
 * A function that fills a list resets the head first, without looking at what it held, and appends records that it
 * allocates. Every record in the ring is the caller's from then on, also when the function fails part way: unlink it
 * with remque(), and free() it, which is the address of the node less the offset of `list` in the record.
 *
 *     WIRELESS_LIST head;
 *     if (MEROWirelessConfEnum(&head) == 0) {
 *       for (WIRELESS_LIST* node = head.q_forw; node != &head; node = node->q_forw) ...
 *     }
 *     while (head.q_forw != &head) {
 *       WIRELESS_LIST* node = head.q_forw;
 *       remque(node);
 *       free((char*)node - offsetof(WIRELESS_NETWORK_CONFIG, list));
 *     }
 */
typedef struct WIRELESS_LIST {
  struct WIRELESS_LIST* q_forw; /**< the next node; first, where insque() and remque() expect it */
  struct WIRELESS_LIST* q_back; /**< the previous node */
} WIRELESS_LIST;

/** A network: as a scan saw it, or the network part of a known one. A copy must not be unlinked. */
typedef struct WIRELESS_NETWORK {
  char szEssid[33];       /**< the name, at most 32 bytes; a scan removes white space from its end */
  unsigned char bssid[6]; /**< the access point's hardware address; all zero when none is known */
  int channel;            /**< the number of the radio channel */
  int signal;             /**< the signal figure as the listing shows it */
  WIRELESS_OPMODE opmode; /**< a scan leaves it 0 */
  WIRELESS_PROTOCOL protocol;
  WIRELESS_AUTH auth;
  WIRELESS_ENCRYPT encrypt; /**< bits, combined */
  WIRELESS_LIST list;       /**< threads the results of a scan */
} WIRELESS_NETWORK;

/** A known network: what is needed to join it again. */
typedef struct WIRELESS_NETWORK_CONFIG {
  char szKey[257];          /**< WEP key (5 or 13 characters, or 10 or 26 hexadecimal digits), WPA passphrase, or the
                                         password of szUser */
  char szIp[20];            /**< IPv4 address in dotted form, or "DHCP"; empty for none */
  char szMask[20];          /**< netmask in dotted form */
  char szGateway[20];       /**< default gateway in dotted form */
  int32_t atime;            /**< when the network was last saved, in seconds since 1970; stays at its greatest value
                                           (in 2038) rather than wrapping */
  WIRELESS_NETWORK network; /**< name, address, mode and security; its own `list` is unused here */
  WIRELESS_LIST list;       /**< threads lists of known networks */
  int noneBssid;            /**< not 0: join whatever access point bears the name */
  char szUser[257];         /**< identity, for networks with WPA-EAP */
} WIRELESS_NETWORK_CONFIG;

/** The answer about the current connection; the request says which member is set. */
typedef union WIRELESS_INFO {
  char szEssid[33];           /**< REQUEST_ESSID */
  WIRELESS_PROTOCOL protocol; /**< REQUEST_PROTOCOL */
  WIRELESS_AUTH auth;         /**< REQUEST_AUTH */
  WIRELESS_OPMODE opmode;     /**< REQUEST_MODE */
  WIRELESS_STATUS status;     /**< REQUEST_STATUS */
} WIRELESS_INFO, *PWIRELESS_INFO;

/** One row of a table between texts and the values of an enumeration. */
typedef struct WIRELESS_LITERAL_MAPPING {
  const char* str;
  union {
    int32_t value; /**< first, so that a table can give it whatever the enumeration is */
    WIRELESS_PROTOCOL protocol;
    WIRELESS_AUTH auth;
    WIRELESS_ENCRYPT encrypt;
    WIRELESS_OPMODE opmode;
  } type;
} WIRELESS_LITERAL_MAPPING;

/** A network and what became of the connection to it. */
typedef struct WIRELESS_REPORT {
  WIRELESS_STATUS status;
  WIRELESS_NETWORK network;
} WIRELESS_REPORT;

/** What an access point with a pre-shared key needs. */
typedef struct MERO_HOSTAP_WPA_PSK_INFO {
  int wpaType; /**< MERO_AP_WPA_PSK_TYPE */
  char szPassPhrase[256];
  int encryptType; /**< MERO_AP_WPA_ENCRYPT_TYPE */
} MERO_HOSTAP_WPA_PSK_INFO, *PMERO_HOSTAP_WPA_PSK_INFO;

/** What an access point needs that lets a RADIUS server decide. */
typedef struct MERO_HOSTAP_WPA_EAP_INFO {
  int wpaType;                  /**< MERO_AP_WPA_PSK_TYPE */
  int encryptType;              /**< MERO_AP_WPA_ENCRYPT_TYPE */
  char szAuthIP[20];            /**< the RADIUS server's IPv4 address */
  int authPort;                 /**< the RADIUS server's UDP port */
  char szAuthSharedSecret[128]; /**< the secret shared with the RADIUS server */
} MERO_HOSTAP_WPA_EAP_INFO, *PMERO_HOSTAP_WPA_EAP_INFO;

/** An access point's secrets; the member in use follows from the MERO_AP_ENCRYPT value beside it. */
typedef union MERO_HOSTAP_ENCRYPT_INFO {
  char szWepPwd[1024];                 /**< AP_ENCRYPT_WEP */
  MERO_HOSTAP_WPA_PSK_INFO wpaPskInfo; /**< AP_ENCRYPT_WPA_PSK */
  MERO_HOSTAP_WPA_EAP_INFO wpaEapInfo; /**< AP_ENCRYPT_WPA_EAP */
} MERO_HOSTAP_ENCRYPT_INFO, *PMERO_HOSTAP_ENCRYPT_INFO;

/** What the clients of the guest network may reach. */
typedef struct MERO_AP_ACCESS_RULE {
  BOOL blLanBlock;      /**< not the appliance's own network */
  BOOL blAccessDS;      /**< the appliance itself */
  BOOL blInternetBlock; /**< not the internet */
  BOOL blAllowHttp;     /**< the appliance's web pages */
} MERO_AP_ACCESS_RULE, *PMERO_AP_ACCESS_RULE;

/** The guest network beside an access point's main one. */
typedef struct MERO_HOSTAP_GUEST_NET {
  BOOL blEnable;
  char szSSID[128];
  char szBSSID[128]; /**< its hardware address as text */
  int hideSSID;      /**< not 0: the name is kept out of the beacons */
  int maxStation;    /**< the most clients allowed */
  BOOL blAPIsolate;  /**< clients may not talk to each other */
  MERO_AP_ENCRYPT encryption;
  MERO_HOSTAP_ENCRYPT_INFO encryptInfo;
} MERO_HOSTAP_GUEST_NET, *PMERO_HOSTAP_GUEST_NET;

/** What the access-point daemon's configuration is written from. */
typedef struct MERO_HOSTAP_CONF {
  char szSSID[128];
  char szBridge[16]; /**< the bridge that the access point joins */
  int hideSSID;      /**< not 0: the name is kept out of the beacons */
  int hwMode;        /**< MERO_AP_MODE bits */
  int ieee80211n;    /**< not 0: 802.11n */
  int wirelessWidth; /**< MERO_AP_FREQ */
  int channel;
  int maxStation; /**< the most clients allowed */
  int wmm;        /**< not 0: WMM */
  MERO_AP_ENCRYPT encryption;
  MERO_HOSTAP_ENCRYPT_INFO encryptInfo;
  MERO_HOSTAP_GUEST_NET guestNet;
} MERO_HOSTAP_CONF, *PMERO_HOSTAP_CONF;

/** When a network is on the air. */
typedef struct MERO_WIFI_SCHED_CONF {
  char szWifiSched[169]; /**< up to 168 characters, as the settings file holds them */
  int wifiSchedEnabled;  /**< not 0: the schedule applies */
} MERO_WIFI_SCHED_CONF, *PMERO_WIFI_SCHED_CONF;

/** All settings of the access point. */
typedef struct _tag_MERO_AP_INFO {
  BOOL blEnable;
  int txpower;        /**< kept for others: nothing here sets it */
  char szSecName[32]; /**< the settings section: the adapter's product name */
  MERO_HOSTAP_CONF hostapConf;
  BOOL blWifiUnblock;                     /**< the user has not switched the radio off */
  MERO_WIFI_SCHED_CONF wifiSchedConf;     /**< the main network's schedule */
  MERO_WIFI_SCHED_CONF guestNetSchedConf; /**< the guest network's schedule */
  MERO_AP_ACCESS_RULE guestNetAccessRule;
} MERO_AP_CONF, *PMERO_AP_CONF;

/* ---- Known networks ------------------------------------------------------------------------------------------- */

/**
 * Saves a network, with its key, its addresses and the time of the save.
 *
 * Networks are told apart by the address of their access point: saving a known address replaces what was saved of it
 * (keys that other programs added stay); any other address, also of a network of the same name, adds a network.
 * Not saved are szUser, noneBssid, and the channel, signal and protocol of the network; `atime` is not looked at.
 *
 * @param pNetCfg  the network; borrowed. No text in it may hold a line feed: the file could not give it back.
 * @return 0; -1 when pNetCfg is null, memory ran out, or the file could not be read or written whole.
 *
 * Reads and replaces /usr/mero/etc/wireless.conf (created with mode 0600), all or nothing also when the power fails.
 * Blocks while another process writes the file and until the disk has the data, never on the network.
 */
int MEROWirelessConfSet(const WIRELESS_NETWORK_CONFIG* pNetCfg);

/**
 * Lists the known networks in the order in which the file holds them.
 *
 * @param pHead  the caller's ring head; reset first, then filled with WIRELESS_NETWORK_CONFIG records, threaded
 *               through `list`. Every record is the caller's, also after a failure.
 * @return 0 (also when nothing is known; the count is not returned); -1 when pHead is null (nothing is reset then),
 *         the file cannot be read, or memory ran out. A network that cannot be read is left out silently.
 *
 * Reads /usr/mero/etc/wireless.conf. Never blocks on the network.
 */
int MEROWirelessConfEnum(WIRELESS_LIST* pHead);

/**
 * Lists the known networks, the most recently saved first.
 *
 * @param pHead  as for MEROWirelessConfEnum().
 * @return as for MEROWirelessConfEnum().
 *
 * Reads /usr/mero/etc/wireless.conf. Never blocks on the network. Networks saved in the same second keep their order
 * in the file.
 */
int MEROWirelessConfEnumByAtime(WIRELESS_LIST* pHead);

/* ---- Scanning ------------------------------------------------------------------------------------------------- */

/**
 * Lists the networks in range. Networks that hide their name are left out.
 *
 * @param scan   WIRELESS_SCAN_RENEW scans afresh; any other value reads what the adapter's last scan found.
 * @param pHead  the caller's ring head; filled with WIRELESS_NETWORK records, threaded through `list`. Every record
 *               is the caller's, also after a failure. When no adapter is plugged in in time, or its interface cannot
 *               be brought up, it is left as it was.
 * @return 0 (also when nothing is in range); -1 when there is no adapter, pHead is null, the interface cannot be
 *         brought up, no shell can be started, or memory ran out. A listing tool that is missing or fails looks like
 *         nothing in range.
 *
 * Waits up to 5 s for an adapter to be plugged in, brings its interface up and waits 1 s; a fresh scan takes a few
 * seconds more. An interface that was down, and has no results, scans by being brought up. Runs /sbin/iwlist up to six
 * times, which waits for the end of a scan that is under way, 10 s at most each time. Reads and writes no file.
 */
int MEROWirelessNetworkScan(const WIRELESS_SCAN scan, WIRELESS_LIST* pHead);

/**
 * Looks up a network in range.
 *
 * @param szValue   for WIRELESS_FILTER_ESSID the name, compared exactly; for WIRELESS_FILTER_BSSID six address bytes
 *                  (not a text).
 * @param filter    what szValue is; any other value takes the first network in range.
 * @param pNetwork  receives the network, untouched unless one was found. Its `list` member is meaningless: do not
 *                  unlink it.
 * @return 1 found, 0 not found, -1 when an argument is null or MEROWirelessNetworkScan() failed.
 *
 * Reads what the adapter's last scan found, and scans afresh only when that is nothing; blocks as long as that does.
 */
int MEROWirelessNetworkGet(const char* szValue, const WIRELESS_FILTER filter, WIRELESS_NETWORK* pNetwork);

/**
 * The text of a radio standard, such as "11b/g/n".
 *
 * @param proto  any value.
 * @return a constant text; "unknown" for WIRELESS_PROTO_UNKNOWN and for what is no standard. Never null.
 */
const char* MEROWirelessProtocolStringGet(const WIRELESS_PROTOCOL proto);

/* ---- Joining networks ----------------------------------------------------------------------------------------- */

/**
 * Starts or joins an ad-hoc cell, open or with one static WEP key.
 *
 * @param pNetCfg  the cell; borrowed. `network.opmode` must be WIRELESS_OPMODE_ADHOC, `network.encrypt`
 *                 WIRELESS_ENCRYPT_NONE or WIRELESS_ENCRYPT_WEP, and for WEP szKey 5 or 13 characters, or 10 or 26
 *                 hexadecimal digits.
 * @return 0; -1 when pNetCfg is null or asks for something else, there is no adapter, the interface cannot be set, or
 *         no shell could be started. After a failure part way the interface stays down. Whether a command was run, and
 *         whether it succeeded, is not noticed.
 *
 * Runs /sbin/iwconfig; blocks for as long as that takes, well below a second. Touches no file.
 */
int MEROWirelessAdhocCreate(const WIRELESS_NETWORK_CONFIG* pNetCfg);

/**
 * Joins a network: through the supplicant, or as an ad-hoc cell when `network.opmode` says so. The interface gets no
 * address: that is MEROWirelessIfconfigSet().
 *
 * @param pNetCfg  the network; borrowed. The access point's address is pinned unless it is all zero or noneBssid is
 *                 set.
 * @return 0 when joined; -1 when there is no adapter, another attempt is under way, pNetCfg is null, or the network
 *         could not be joined, in time or at all. With an adapter whose radio is switched off, or may be
 *         (MEROWirelessCheckBlock() does not give 1), nothing is tried, and the result is 0, without a report.
 *
 * Blocks up to about 15 s, and then for the media service to start anew where /etc/meroinfo.conf has it on the
 * interface. Writes /usr/mero/etc/wpa_supplicant.conf and, once joined, /var/tmp/.wireless_current_connection; holds
 * the marker /var/tmp/.wireless_connecting meanwhile (every call removes it at its end, also one that is refused
 * because of it); copies /etc/resolv.conf to /etc/resolv.conf.wireless.bak; leaves the supplicant running, with its pid
 * in /var/run/wpa_supplicant.pid.
 */
int MEROWirelessNetworkConnect(const WIRELESS_NETWORK_CONFIG* pNetCfg);

/**
 * Joins the most recently saved network that can be joined, and addresses the interface as saved. The saved gateway is
 * not set: that is MEROWirelessDefaultGatewaySet(). A network that is not found in the air may hide its name, and is
 * tried all the same if its authentication and encryption are known.
 *
 * A network is found by its access point's address alone, and takes on all that the scan tells of it: name,
 * authentication and encryption, whatever was saved. Addresses can be made up: SECURITY.md tells what becomes of it.
 * MEROWirelessNetworkConnect() keeps to the record that it is given.
 *
 * @return 0 when connected and addressed; -1 otherwise, with nothing left connected: also a connection that exists
 *         already is ended, and the result is -1. Where MEROWirelessNetworkConnect() gives 0 because the radio may not
 *         be used, so does this: nothing is joined, and the interface is addressed as for the first network tried.
 *
 * Blocks, for each known network up to the one that is joined, as long as MEROWirelessNetworkGet() (5 s without an
 * adapter), once in a call for as long again, and up to about 15 s more if the network is tried; then as
 * MEROWirelessIfconfigSet(), up to 16 s for DHCP; after a failure, up to 2 s for each daemon to end. Files as for
 * MEROWirelessNetworkConnect() and MEROWirelessIfconfigSet().
 */
int MEROWirelessAutoConnect(void);

/**
 * Gives an interface its address: by DHCP when `config.szIp` is exactly "DHCP", else the static address and mask of
 * `config`.
 *
 * @param szIfName  the interface, up to 15 characters.
 * @param config    the saved network; only szIp and szMask are used.
 * @return 0; -1 when szIfName is null or the interface could not be set. A DHCP server that does not answer is
 *         reported, and is not by itself a failure: it is asked on until the network is left or another address is set,
 *         and a late answer addresses the interface.
 *
 * Blocks up to 16 s for DHCP, and before that up to 2 s for a DHCP client that runs to end. Writes the interface's file
 * in /etc/sysconfig/network-scripts.
 */
int MEROWirelessIfconfigSet(const char* szIfName, WIRELESS_NETWORK_CONFIG config);

/**
 * Adds a default route through the wireless interface.
 *
 * @param szGateway  the gateway's IPv4 address in dotted form.
 * @return 0; -1 when szGateway is null, empty, or longer than a command can be, or no shell could be started. Whether
 *         the command was run, and whether it succeeded, is not noticed. An existing default route is not removed.
 *
 * Runs /sbin/route, and blocks for as long as that takes.
 */
int MEROWirelessDefaultGatewaySet(const char* szGateway);

/**
 * Tells the state of the connection.
 *
 * @return a WIRELESS_STATUS, from the driver; WIRELESS_STATUS_UNKNOWN when it cannot be asked. Does not block.
 */
WIRELESS_STATUS MEROWirelessConnStatusGet(void);

/* ---- Access point --------------------------------------------------------------------------------------------- */

/**
 * Reads the access-point settings of one adapter model.
 *
 * @param szSecName  the settings section, from MEROWirelessApConfigSecNameGet().
 * @param pConf      receives the settings; the defaults when the file or the section is missing; untouched when an
 *                   argument is null.
 * @return a number greater than 0 when the section was read; 0 or less when pConf holds defaults only, or an argument
 *         is null.
 *
 * Reads /usr/mero/etc/wireless_ap.conf. Does not block.
 */
int MEROWirelessGetAPConfig(const char* szSecName, PMERO_AP_CONF pConf);

/**
 * The settings section of the adapter that is plugged in: its product name.
 *
 * @param szSecName  receives the name, cut to cbSize bytes with its terminator.
 * @param cbSize     the size of szSecName in bytes.
 * @return TRUE when the name was read; FALSE when szSecName is null or no adapter has been announced.
 *
 * Reads /tmp/wireless.info. Does not block.
 */
BOOL MEROWirelessApConfigSecNameGet(char* szSecName, size_t cbSize);

/**
 * Saves the access-point settings. With `blEnable` FALSE only the switch itself is saved, and all else stays; a section
 * that is new then holds nothing else.
 *
 * @param pConf  the settings; `szSecName` names the section. No text may hold a line feed, nor may the name begin or
 *               end with white space: the file could not carry it.
 * @return TRUE; FALSE when pConf is null, a text cannot be saved, an encryption is none of MERO_AP_ENCRYPT or none for
 *         a guest network, memory ran out, or the file could not be written.
 *
 * Reads and replaces /usr/mero/etc/wireless_ap.conf (created with mode 0600), all or nothing. Blocks while another
 * process writes the file and until the disk has the data, never on the network.
 */
BOOL MEROWirelessSetAPConfig(const PMERO_AP_CONF pConf);

/**
 * Tells whether the user has switched the radio off in the access-point settings.
 *
 * @return 1 the radio may be used: also when there is no settings file, or no section of the adapter in it; 0 it is
 *         switched off; -1 unknown: there are settings, but no adapter has been announced, or its section lacks
 *         `unblock`, or memory ran out. None of this is reported to syslog.
 *
 * Reads /usr/mero/etc/wireless_ap.conf and /tmp/wireless.info. Does not block.
 */
int MEROWirelessCheckBlock(void);

/**
 * Writes the access-point daemon's files. A daemon that runs for the interface is told to end, and the interface is
 * taken down; nothing here starts either again.
 *
 * @param szIfName  the wireless interface.
 * @param pConf     the settings; must not be null. No name or secret that is written may hold a line feed.
 * @return TRUE; FALSE when szIfName is null, a text cannot be written, or a file could not be. A daemon that could not
 *         be looked for or ended, and an interface that stays up, do not make it fail.
 *
 * Writes /etc/hostapd/hostapd-IF-host.conf and, on a model with a built-in card, hostapd-IF-guest.conf and
 * hostapd-IF-guest.info. Does not block on the network.
 */
BOOL MEROWirelessSetHostAPConf(const char* szIfName, PMERO_HOSTAP_CONF pConf);

/**
 * Turns the adapter into an access point, by the settings that are saved for it. Callers name the section with
 * MEROWirelessApConfigSecNameGet(), read it with MEROWirelessGetAPConfig(), set `blEnable` to TRUE and what else they
 * want, save it with MEROWirelessSetAPConfig(), and then call this.
 *
 * @return TRUE when everything, also the network start script, succeeded; FALSE otherwise, above all when no adapter
 *         has been announced, or its saved settings are missing, have `blEnable` FALSE, or name no bridge. Nothing is
 *         undone after a failure.
 *
 * Blocks until the network start script /etc/rc.network has finished: as a rule a few seconds, but up to 60 s for
 * another run of the script to end, and up to about 30 s for the daemon to be on the air. Writes the access-point
 * daemon's files, the bridge's and the interface's network-script files and the DHCP server's files; holds the marker
 * /var/tmp/.wireless_ap_connecting meanwhile (every call removes it at its end, also one that is refused because of
 * it).
 */
BOOL MEROWirelessAPEnable(void);

/**
 * Takes the access point down and gives the interface back to client use. The saved settings stay as they are.
 *
 * @return TRUE; FALSE when the interface's file is missing, the DHCP server's files could not be written, or the
 *         network start script failed.
 *
 * Blocks until the network start script /etc/rc.network has finished, up to 60 s of it for another run of the script to
 * end. Must not run beside MEROWirelessAPEnable().
 */
BOOL MEROWirelessAPDisable(void);

/* ---- Operating mode ------------------------------------------------------------------------------------------- */

/**
 * Switches the adapter between access-point mode and client mode, also when it is in that mode already.
 *
 * @param mode  WIRELESS_AP_MODE or WIRELESS_CLIENT_MODE.
 * @return TRUE when the hot-plug script ran with success; FALSE otherwise, and for any other mode.
 *
 * Blocks until /usr/mero/hotplug/usb.wireless.function has finished, which waits for the network start script as
 * MEROWirelessAPEnable() and MEROWirelessAPDisable() do.
 */
BOOL MEROWirelessModeChange(MERO_WIRELESS_MODE mode);

/** @return the name of the interface that serves as access point: the constant text "wlan0". */
const char* MEROWirelessAPInterfaceGet(void);

/** @return FALSE, whatever the hardware: access-point mode is not announced as supported. */
BOOL MEROWirelessAPIsSupported(void);

/** @return TRUE while an access point is being set up (the marker file exists), else FALSE. Does not block. */
BOOL MEROWirelessTestAPMode(void);

#ifdef __cplusplus
} /* extern "C" */
#endif

#pragma GCC visibility pop

#endif /* MERO_WIRELESS_H */
