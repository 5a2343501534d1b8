/**
 * @file platform.h
 * The platform services under the wireless library: errors, files, text hash, text list, commands, radio, interface,
 * bridge, DHCP server, addressing, media. libmerocore offers the groups up to the interface, libmerosdk the others;
 * an appliance may bring its own of either.
 *
 * What holds for every operation below:
 *
 *  1. Text is a run of bytes that ends with NUL. A copy into a buffer is bounded by the buffer's size and terminated.
 *  2. A null pointer where a value is required is a failure (ERR_BAD_PARAMETERS), never a crash.
 *  3. An operation that fails sets the error code, and reports the path or the device and the reason to syslog at
 *     LOG_ERR. Finding nothing (no such file, section or key) is no failure: it sets the error code and reports
 *     nothing. Outputs are untouched unless the operation succeeded.
 *  4. A file is replaced as a whole: the new content is written beside it, flushed to disk and renamed over it, so
 *     that a reader, a crash and a full disk find the old content or the new. Mode and owner stay; a symbolic link is
 *     followed, not replaced. From reading to renaming the file is locked against other writers. An operation
 *     leaves every byte alone that it is not about: comments, blank lines, other keys and sections, their order. The
 *     caller's umask has no say in the mode of what is created.
 *  5. Operations block for the disk, for another writer's lock (20 s at most, a failure then), for commands that they
 *     run, however long these take, and for the network only where it says so.
 *  6. In a directory that anyone may write, such as /tmp, no link is followed, and a file is root's or the caller's
 *     own, a plain one, with one name. What somebody else has put there does not exist (PLIBCFileExist), and is neither
 *     read nor changed (ERR_PERMISSION). PLIBCFileTouch and PLIBCSysUnlink remove it; a directory they move aside, to
 *     NAME.foreign-NUMBER.
 *  7. Not thread-safe. Descriptors are close-on-exec.
 *
 * The header is usable from C99 and from C++11 on.
 */
#ifndef MERO_PLATFORM_H
#define MERO_PLATFORM_H

#include <netinet/in.h>

#include "wireless.h"

#pragma GCC visibility push(default)

#ifdef __cplusplus
extern "C" {
#endif

#ifndef __cplusplus
typedef int32_t MERO_ERROR;
typedef int32_t BR_TYPE;
#endif

/* ---- Errors --------------------------------------------------------------------------------------------------- */

/** The error codes that the platform sets. */
enum MERO_ERROR MERO_INT32 {
  ERR_NONE = 0x0000,
  ERR_UNKNOWN = 0x0100,
  ERR_OUT_OF_MEMORY = 0x0200,
  ERR_BAD_PARAMETERS = 0x0300, /**< also a text that the file's format cannot hold */
  ERR_PERMISSION = 0x0400,
  ERR_NO_SPACE = 0x0500, /**< disk or quota full */
  ERR_IO = 0x0600,
  ERR_FILE_NOT_FOUND = 0x0700,
  ERR_SECTION_NOT_FOUND = 0x0800,
  ERR_KEY_NOT_FOUND = 0x0900,
  ERR_TOO_LARGE = 0x0A00, /**< a file beyond what is read, or a result beyond its buffer */
  ERR_NO_DEVICE = 0x0B00,
  ERR_COMMAND_FAILED = 0x0C00, /**< a program could not be run, or has failed */
};

/**
 * Sets the error code of this process.
 *
 * @param code  any value.
 */
void PLIBCErrSet(int code);

/** @return the code of the last failure in this process, 0 before any. Successful operations leave it alone. */
int PLIBCErrGet(void);

/* ---- Text hash ------------------------------------------------------------------------------------------------ */

/** A map from text keys to text values that keeps the order in which keys were first set. */
typedef struct PLIBSZHASH PLIBSZHASH, *PPLIBSZHASH;

/**
 * Makes an empty hash.
 *
 * @param cbSize  how many bytes of text to make room for at first; it grows as needed.
 * @return the hash, to be freed by the caller with PLIBCSzHashFree(); null when memory ran out.
 */
PPLIBSZHASH PLIBCSzHashAlloc(int cbSize);

/** Frees a hash and all its texts. Null is allowed. */
void PLIBCSzHashFree(PPLIBSZHASH pshHash);

/**
 * Looks a key up, in constant time.
 *
 * @param szKey  compared exactly.
 * @return the value, owned by the hash and valid until the key is set again or the hash is freed; null when absent.
 */
const char* PLIBCSzHashGetValue(const PLIBSZHASH* pshHash, const char* szKey);

/**
 * Sets a key, keeping copies of both texts. A key that is present keeps its place in the order.
 *
 * @param ppshHash  the address of the caller's hash pointer, since a hash may move when it grows.
 * @return 1; -1 when memory ran out, with the pairs as they were. The hash remembers that it lacks a pair, and writing
 *         it into a section fails from then on: callers need not look at the result.
 */
int PLIBCSzHashSetValue(PPLIBSZHASH* ppshHash, const char* szKey, const char* szValue);

/* ---- Text list ------------------------------------------------------------------------------------------------ */

/** A growable list of texts. Only `nItem` is for callers to read. */
typedef struct PLIBSZLIST {
  int32_t nCapacity;
  int32_t nItem; /**< the number of items */
  char** ppszItem;
} PLIBSZLIST, *PPLIBSZLIST;

/**
 * Makes an empty list.
 *
 * @param cbSize  how many bytes to make room for at first; it grows as needed.
 * @return the list, to be freed by the caller with PLIBCSzListFree(); null when memory ran out.
 */
PPLIBSZLIST PLIBCSzListAlloc(int cbSize);

/** Frees a list and its texts. Null is allowed. */
void PLIBCSzListFree(PPLIBSZLIST pslList);

/** @return the text at `index` (from 0), owned by the list; null when there is none. */
const char* PLIBCSzListGet(const PLIBSZLIST* pslList, int index);

/** @return the index of the first item that equals `szText` exactly; -1 when absent. */
int PLIBCSzListFind(const PLIBSZLIST* pslList, const char* szText);

/**
 * Removes one item; those behind it move up.
 *
 * @return 0; -1 when there is no item at `index`.
 */
int PLIBCSzListRemove(PPLIBSZLIST pslList, int index);

/* ---- Files ---------------------------------------------------------------------------------------------------- */

/** @return 1 when the path names something that exists (a dangling link does not, nor what 6 above speaks of), or that
 *          cannot be looked at; else 0. */
int PLIBCFileExist(const char* szPath);

/**
 * Creates a file, empty and with mode 0600, unless it exists.
 *
 * @return 0; -1 on failure.
 */
int PLIBCFileTouch(const char* szPath);

/*
 * Key/value files: one KEY=value a line, as a shell reads them; mero-network-scripts(5) tells what counts.
 *
 * `szFormat` is the form of the line that is written: it holds "%s" twice, for the key and the value, and no other
 * conversion, such as "%s=%s\n". A key or value that could not be read back (a line feed in it, say) is refused with
 * ERR_BAD_PARAMETERS, and the file stays.
 */

/**
 * Reads a value.
 *
 * @param szValue  receives the value, cut to cbValue bytes with its terminator.
 * @param flags    0.
 * @return 1 found (also when empty), 0 no such key or file, -1 on failure.
 */
int PLIBCFileGetKeyValue(const char* szPath, const char* szKey, char* szValue, size_t cbValue, int flags);

/**
 * Sets a value, in place of the key's line or, when there is none, at the end. A missing file is created, mode 0644.
 *
 * @return 1; -1 on failure.
 */
int PLIBCFileSetKeyValue(const char* szPath, const char* szKey, const char* szValue, const char* szFormat);

/** @return 1 when the file holds the key with exactly the value `szExpected`, else 0. `flags` is 0. */
int PLIBCFileCheckKeyValue(const char* szPath, const char* szKey, const char* szExpected, int flags);

/**
 * Removes every line of a key.
 *
 * @return 1 removed, 0 no such key or file, -1 on failure.
 */
int PLIBCFileRemoveKey(const char* szPath, const char* szKey);

/*
 * Section files: a line with a name in square brackets opens a section, which reaches to the next such line; KEY=value
 * lines follow. mero-wireless.conf(5) tells what counts. These files hold secrets: one that is created gets mode 0600.
 * `szFormat` is as above.
 */

/**
 * Lists the sections, in file order, but those with a NUL in their name.
 *
 * @param ppslList  the address of the caller's list pointer; names are appended.
 * @return how many were appended, 0 also for a missing file; -1 on failure.
 *
 * An empty list that gets the names of /usr/mero/etc/wireless.conf keeps the file's text for MEROWirelessConfGet(),
 * until it is freed; the secrets in it are wiped then.
 */
int PLIBCFileEnumSection(const char* szPath, PPLIBSZLIST* ppslList);

/**
 * Reads a section into a hash, key by key in file order.
 *
 * @param ppshHash  the address of the caller's hash pointer; keys that it holds already stay. After a failure it may
 *                  hold part of the section.
 * @return 1 found, 0 no such section or file, -1 on failure.
 */
int PLIBCFileGetSection(const char* szPath, const char* szSection, PPLIBSZHASH* ppshHash);

/**
 * Appends a section that holds the pairs of a hash, in its order. One that exists is set instead.
 *
 * @return 1; -1 on failure, also when a pair of the hash found no memory (ERR_OUT_OF_MEMORY).
 */
int PLIBCFileAddSection(const char* szPath, const char* szSection, const PLIBSZHASH* pshHash, const char* szFormat);

/**
 * Replaces all pairs of a section by those of a hash, in its order; comments and blank lines stay. A section that is
 * absent is added.
 *
 * @param szNewName  the section's new name; null keeps the name.
 * @return 1; -1 on failure, also when a pair of the hash found no memory (ERR_OUT_OF_MEMORY).
 */
int PLIBCFileSetSection(const char* szPath, const char* szSection, const char* szNewName, const PLIBSZHASH* pshHash,
                        const char* szFormat);

/**
 * Sets one key of a section, in place of its line or, when there is none, behind the section's last key. A section or
 * file that is absent is added.
 *
 * @return 0; -1 on failure.
 */
int PLIBCFileSetSectionValue(const char* szPath, const char* szSection, const char* szKey, const char* szValue,
                             const char* szFormat);

/**
 * Removes every section of a name, with all that stands in it up to the next section.
 *
 * @return 1 removed, 0 no such section or file, -1 on failure.
 */
int PLIBCFileRemoveSection(const char* szPath, const char* szSection);

/* ---- Commands ------------------------------------------------------------------------------------------------- */

/**
 * Runs a program, without a shell, and waits until it has finished.
 *
 * @param szPath  the program's path; szArg1 to szArg4 are its arguments, ended by the first null.
 * @return the program's exit status, 0 on success; -1 when it could not be run or was ended by a signal.
 *
 * Blocks for as long as the program runs. The program inherits the standard descriptors and nothing else.
 */
int PLIBCExec(const char* szPath, const char* szArg1, const char* szArg2, const char* szArg3, const char* szArg4);

/** Removes a file; see 6 above. @return 0, also when there was none; -1 on failure. */
int PLIBCSysUnlink(const char* szPath);

/** Removes a file or an empty directory. @return 0, also when there was none; -1 on failure. */
int PLIBCSysRemove(const char* szPath);

/* ---- Radio ---------------------------------------------------------------------------------------------------- */

/** @return the number of wireless adapters present. */
int MEROWirelessAdapterNum(void);

/** @return the name of the client interface: the first adapter's by name, "wlan0" when there is none. Never null;
 *          valid until the next call. */
const char* MEROWirelessInterfaceGet(void);

/**
 * Asks about the current connection.
 *
 * The driver answers; only the protocol and the authentication come from the record of the last join
 * (/var/tmp/.wireless_current_connection), and are unknown when that names another access point than the driver. While
 * the adapter is an access point there is no connection: no name, nothing known, WIRELESS_STATUS_DISCONNECTED.
 *
 * @param pInfo  receives the answer in the member that belongs to the request. For REQUEST_STATUS it is also set,
 *               to WIRELESS_STATUS_NO_ADAPTER or WIRELESS_STATUS_DOWN, when there is nothing to ask.
 * @return 0; -1 when the request is unknown or the adapter cannot be asked.
 */
int MEROWirelessCurInfoGet(WIRELESS_REQUEST request, PWIRELESS_INFO pInfo);

/**
 * Reads a known network from /usr/mero/etc/wireless.conf.
 *
 * @param szSection  the section's name: the access point's address as text. The very pointer that PLIBCSzListGet()
 *                   gives for a list of PLIBCFileEnumSection() stands for the section as it was when the list was made;
 *                   any other is looked for in the file as it is.
 * @param pNetCfg    receives the network; untouched unless it was read. A missing or malformed value leaves its field
 *                   empty or unknown; a time beyond 32 bits becomes the greatest.
 * @return 0; -1 when there is no such section or the file cannot be read.
 *
 * Reads the file, in linear time, but not for the pointers of a list: one after another, all sections of a list take
 * time linear in the file, too.
 */
int MEROWirelessConfGet(const char* szSection, WIRELESS_NETWORK_CONFIG* pNetCfg);

/**
 * Sets what the client interface is operated as. Most drivers want the interface down.
 *
 * @return 0; -1 when there is no such mode or the driver refuses.
 */
int MEROWirelessOpmodeSet(WIRELESS_OPMODE opmode);

/**
 * Ends whatever connection the client interface has: the supplicant, the DHCP client with the route and the name
 * servers that it has leased, an ad-hoc cell, its addresses, and the record of the last join.
 *
 * @return 0, also when there was none; -1 when something could not be ended.
 *
 * Blocks up to 2 s for each daemon to end, and kills one that does not; and for as long as /usr/mero/sbin/udhcpc.lease
 * takes to give back what was leased. Where there is no such script, nothing was leased.
 */
int MEROWirelessNetworkDisconnect(void);

/** @return the constant text of an authentication, such as "WPA2PSK"; "UNKNOWN" for what is none. */
const char* MEROWirelessAuthStringGet(WIRELESS_AUTH auth);

/**
 * The text of an encryption.
 *
 * @param form  0: for files and people, such as "TKIPAES"; 1: the supplicant's list of those of TKIP and AES that the
 *              value has, whatever else it has, such as "TKIP CCMP".
 * @return a constant text; "UNKNOWN" for what is no encryption, and in form 1 an empty one for what has neither.
 */
const char* MEROWirelessEncryptStringGet(WIRELESS_ENCRYPT encrypt, int form);

/** @return the constant text of an operating mode, such as "MANAGED"; "UNKNOWN" for what is none. */
const char* MEROWirelessOpmodeStringGet(WIRELESS_OPMODE opmode);

/**
 * Writes a hardware address as text: "00:11:22:AA:BB:CC".
 *
 * @param rgbBssid  six bytes.
 * @param szBssid   receives the text, cut to cbBssid bytes with its terminator; 18 hold it all.
 * @return szBssid; null when an argument is null.
 */
char* MEROWirelessBssidStringGet(const unsigned char* rgbBssid, char* szBssid, size_t cbBssid);

/** @return the authentication of a text that MEROWirelessAuthStringGet() gives, in any case; else unknown. */
WIRELESS_AUTH MEROWirelessAuthParse(const char* szAuth);

/** @return the encryption of a text that MEROWirelessEncryptStringGet() gives in form 0, in any case; else unknown. */
WIRELESS_ENCRYPT MEROWirelessEncryptParse(const char* szEncrypt);

/** @return the standard of a text that MEROWirelessProtocolStringGet() gives, in any case; else unknown. */
WIRELESS_PROTOCOL MEROWirelessProtocolParse(const char* szProtocol);

/* ---- Interface ------------------------------------------------------------------------------------------------ */

/**
 * Brings an interface up.
 *
 * @return 1; 0 on failure.
 *
 * A client's wireless adapter that was down, and has heard of no network lately, begins to scan, so that results are
 * there when somebody asks for them; the call does not wait for that, and whether the adapter scans makes no difference
 * to its result.
 */
int PLIBNetIfUp(const char* szIfName);

/** Takes an interface down. @return 1; 0 on failure. */
int PLIBNetIfDown(const char* szIfName);

/* ---- Bridge --------------------------------------------------------------------------------------------------- */

/** How an interface is addressed. */
typedef struct NETINFO {
  BOOL blManual; /**< a static address, else DHCP */
  BOOL blActive; /**< comes up at boot */
  char szInterface[16];
  unsigned char rgbMac[6]; /**< its hardware address */
  char szIp[20];           /**< IPv4 address in dotted form */
  char szMask[20];         /**< netmask in dotted form */
} NETINFO, *PNETINFO;

/** What an interface is to a bridge. */
enum BR_TYPE MERO_INT32 {
  TYPE_BR_UNKNOWN = 0,
  TYPE_NOT_BR = 1,
  TYPE_BR_MASTER = 2,  /**< a bridge that passes frames between its members */
  TYPE_NAT_MASTER = 3, /**< a bridge whose members reach other networks through address translation */
  TYPE_SLAVE = 4,
};

/** A bridge, or a member of one. */
typedef struct BRIDGE_INFO {
  BR_TYPE type;
  char szIfName[16];
  union {
    char szPrimary[16]; /**< of a bridge: its first member */
    char szBridge[16];  /**< of a member: its bridge */
  } info;
} BRIDGE_INFO, *PBRIDGE_INFO;

/**
 * Lists the interfaces that the kernel has in a bridge at this moment.
 *
 * @param ppslList  the address of the caller's list pointer; names are appended, in order.
 * @return how many were appended, 0 also for a bridge that the kernel does not have; -1 for a name that none can have
 *         (ERR_NO_DEVICE) and when memory ran out, with the list as it was.
 */
int PLIBNetBridgeSlaveEnum(const char* szBridge, PPLIBSZLIST* ppslList);

/**
 * Reads a bridge's configuration from its network-script file, /etc/sysconfig/network-scripts/ifcfg-BRIDGE. A bridge is
 * configured when the file says TYPE=Bridge.
 *
 * @return 0; -1, without a report, when the bridge is not configured (ERR_NO_DEVICE).
 */
int MERONetGetBridgeConfig(const char* szBridge, PNETINFO pNetInfo, PBRIDGE_INFO pBridgeInfo);

/**
 * Creates or rewrites a bridge's network-script file; keys that it does not know stay. The network start script makes
 * the bridge itself. What is written reads back the same, field by field.
 *
 * @param pNetInfo     names the bridge in szInterface. Empty addresses and a hardware address of zeros are none.
 * @param pBridgeInfo  a bridge of either type, and its first member, which may be empty. Its szIfName is the same as
 *                     szInterface; one of them may be empty.
 * @return 0; -1 on failure. A record that is no bridge's, that names none, two, or itself as its first member, or with
 *         a text that is not one plain word, is refused with ERR_BAD_PARAMETERS before anything is written.
 */
int MERONetSetBridgeConfig(const NETINFO* pNetInfo, const BRIDGE_INFO* pBridgeInfo);

/* ---- DHCP server ---------------------------------------------------------------------------------------------- */

/** What a DHCP server gives out on one interface. */
typedef struct MERO_DHCPD_CONF {
  BOOL blEnable; /**< the server serves; on writing, the switch beside the record says so */
  int autoTime;
  int leaseTime;         /**< seconds; 0 leaves it to the server, and -1 is a lease without end */
  char szRangeStart[20]; /**< the first address given out */
  char szRangeEnd[20];   /**< the last */
  char szInterface[16];
  char szDomain[4096];
  char szDns[20];
  char szSDns[20];   /**< the second name server */
  char szSubnet[20]; /**< the netmask */
  char szRouter[20];
  char szLeaseFile[4096];
  char szTag[20]; /**< tells several configurations of one interface apart */
} MERO_DHCPD_CONF, *PMERO_DHCPD_CONF;

/**
 * Reads the configuration that is kept for an interface and a tag: /etc/dhcpd/dhcpd-INTERFACE-TAG.conf, and beside it
 * the .info file with the switch. The .conf is read as dnsmasq reads it: without comments and quotes; what the record
 * has no field for is passed over.
 *
 * @return 1 read; 0 when there is none (also for names that can have none), or when it cannot be read.
 */
int MERONetGetDhcpServerConf(const char* szIfName, const char* szTag, PMERO_DHCPD_CONF pConf);

/**
 * Writes the server's files: the .conf, which dnsmasq reads, then the .info file. Their directory is made when it is
 * missing. Where the files read as the record already, only the switch is set: a record that was read can be given
 * back, whatever else the .conf says. The network start script starts the server.
 *
 * @param pConf   reads back the same, field by field; only blEnable is what the switch was. Neither szInterface nor
 *                szTag is empty or holds a '/'.
 * @param enable  1: the server serves; 0: it does not, and all else is kept.
 * @return 1; 0 on failure. What the .conf cannot hold is refused with ERR_BAD_PARAMETERS before anything is written:
 *         mero-dhcpd(5) tells what that is, and what dnsmasq asks for besides.
 */
int MERONetSetDhcpServerConfigFiles(const MERO_DHCPD_CONF* pConf, int enable);

/* ---- Addressing ----------------------------------------------------------------------------------------------- */

/**
 * Tells whether an address is a host's in the subnet of another.
 *
 * @return 1; 0 when it is outside, is the network's or the broadcast address, or a text is no address or no mask.
 */
int MERONetIsSameSubnet(const char* szAddress, const char* szReference, const char* szMask);

/** @return the dotted text of an address, valid until the next call. */
const char* MERONetNtoa(struct in_addr address);

/**
 * Applies an address to an interface at once, as the only one that it has, and notes it in the interface's
 * network-script file. An address that it has already stays, and so do the routes that go with it. Who applies what is
 * noted at boot is the appliance's own affair: the kit does so for bridges only. A static address ends the interface's
 * DHCP client, and gives back what that has leased.
 *
 * @param flags  0.
 * @return 0; -1 when the address or the mask is none (the interface stays as it was), or the interface cannot be set
 *         (it has the addresses that it had).
 */
int MERONetSetCard1(const NETINFO* pNetInfo, int flags);

/**
 * Leases an address by DHCP for the interface that the record names, in place of those that it has, and keeps the lease
 * renewed after it returns. Where no server has answered in time it goes on asking all the same, and a late answer
 * addresses the interface. MEROWirelessNetworkDisconnect(), a static address and the next lease end that.
 *
 * @param pNetInfo  names the interface; receives its hardware address, the address leased and its mask.
 * @param seconds   how long to wait for a server, which is asked each second, at most; less than 1 counts as 1.
 * @return 0; -1 when no server has answered yet, or the interface cannot be brought up.
 *
 * /usr/mero/sbin/udhcpc.lease applies what is leased, and gives it back when the client ends; mero_connection(3) tells
 * what that is.
 *
 * Blocks for as long at most, and before that up to 2 s for a DHCP client that runs to end; one that does not is
 * killed. A server that keeps the client busy without a lease has it ended after 15 s more, and nothing goes on asking.
 */
int MEROIGetDHCPTestNetInfo(PNETINFO pNetInfo, int seconds);

/* ---- Media ---------------------------------------------------------------------------------------------------- */

/**
 * Makes the appliance's media service act.
 *
 * @param action  0 stop, 1 start, 2 restart.
 * @return 0; -1 when there is no such action or no such service, or the service's script failed.
 */
int MEROMediaService(int action);

#ifdef __cplusplus
} /* extern "C" */
#endif

#pragma GCC visibility pop

#endif /* MERO_PLATFORM_H */
