// What one appliance knows goes to another one, as a document.
#include <filesystem>
#include <nlohmann/json.hpp>

#include "real_store.h"
#include "running.h"

namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::Not;

constexpr char kPath[] = "/usr/mero/etc/wireless.conf";
constexpr char kFile[] = "/tmp/documents/settings.json";

constexpr char kStore[] =
    "# by hand\n"
    "[0A:0A:0A:0A:0A:0A]\n"
    "\tKEY=open sesame\n"
    "\tIPADDR=DHCP\n"
    "\tNETMASK=\n"
    "\tGATEWAY=\n"
    "\tESSID=Home\n"
    "\tBSSID=0A:0A:0A:0A:0A:0A\n"
    "\tMODE=MANAGED\n"
    "\tACCESS_TIME=86400\n"
    "\tAUTH=WPA2PSK\n"
    "\tENCRYPT=AES\n"
    "\tCOLOUR= blue \n"
    "\tPRIORITY=7\n"
    "\n"
    "[0A:0A:0A:0A:0A:0C]\n"
    "\tKEY=\n"
    "\tIPADDR=10.0.0.5\n"
    "\tNETMASK=255.255.255.0\n"
    "\tGATEWAY=10.0.0.1\n"
    "\tESSID=caf\xE9\n"
    "\tBSSID=0A:0A:0A:0A:0A:0C\n"
    "\tMODE=MANAGED\n"
    "\tACCESS_TIME=86200\n"
    "\tAUTH=OPEN\n"
    "\tENCRYPT=NONE\n"
    "\tDNS=1.1.1.1 8.8.8.8\n"
    "\tAUTOJOIN=no\n";

class Export : public ToolTest {
 protected:
  Export() {
    UseRealStore();
    Shell("rm -rf /tmp/documents; mkdir /tmp/documents");
    WriteText(kPath, kStore);
  }

  static json Exported(std::vector<std::string> options = {}) {
    options.insert(options.begin(), "export");
    const Ran ran = Tool(options);
    EXPECT_EQ(ran.status, 0) << ran.err;
    return json::parse(ran.out);
  }
};

TEST_F(Export, TellsEachNetworkWithWhatIsSavedOfIt) {
  const json document = Exported();
  EXPECT_EQ(document["version"], 1);
  EXPECT_EQ(document["networks"], json::parse(R"([
    {"name": "Home", "address": "0A:0A:0A:0A:0A:0A", "auth": "WPA2PSK", "encryption": "AES", "mode": "MANAGED",
     "ip": "DHCP", "mask": null, "gateway": null, "name_servers": null, "priority": 7, "autojoin": true,
     "saved": "1970-01-02T00:00:00Z"},
    {"name": {"hex": "636166e9"}, "address": "0A:0A:0A:0A:0A:0C", "auth": "OPEN", "encryption": "NONE",
     "mode": "MANAGED", "ip": "10.0.0.5", "mask": "255.255.255.0", "gateway": "10.0.0.1",
     "name_servers": "1.1.1.1 8.8.8.8", "priority": 0, "autojoin": false, "saved": "1970-01-01T23:56:40Z"}])"));
}

TEST_F(Export, TellsTheAccessPointsSettingsButNotItsSwitch) {
  EXPECT_TRUE(Exported()["access_point"].is_null());
  library::SavedAp(library::Office());
  const json ap = Exported()["access_point"];
  EXPECT_EQ(ap["ssid"], "Office");
  EXPECT_EQ(ap["encryption"], "wpa2");
  EXPECT_EQ(ap["channel"], 6);
  EXPECT_EQ(ap["wmm_enabled"], true);
  for (const char* szKey : {"enable", "has_secret", "secret", "guest_net_secret"}) EXPECT_FALSE(ap.contains(szKey));
  EXPECT_TRUE(Exported({"--networks"})["access_point"].is_null());
}

TEST_F(Export, TellsSecretsOnlyWhenAskedTo) {
  library::SavedAp(library::Office());
  EXPECT_THAT(Tool({"export"}).out, Not(HasSubstr("open sesame")));
  const json document = Exported({"--secrets"});
  EXPECT_EQ(document["networks"][0]["secret"], "open sesame");
  EXPECT_TRUE(document["networks"][1]["secret"].is_null());
  EXPECT_EQ(document["access_point"]["secret"], "open sesame");
}

TEST_F(Export, IsTheSameInAllFormsAndOneLineInJson) {
  const std::string document = Tool({"export"}).out;
  EXPECT_EQ(Tool({"export", "-"}).out, document);
  EXPECT_EQ(Tool({"export", "--porcelain"}).out, document);
  const std::string line = Tool({"export", "--json"}).out;
  EXPECT_EQ(json::parse(line), json::parse(document));
  EXPECT_EQ(line.find('\n'), line.size() - 1);
}

TEST_F(Export, HoldsNothingThatATerminalActsUpon) {
  WriteText(kPath, "[0A:0A:0A:0A:0A:0A]\n\tESSID=a\xC2\x9BJ\x7F\x1B[\n\tBSSID=0A:0A:0A:0A:0A:0A\n\tAUTH=OPEN\n");
  EXPECT_THAT(Tool({"export"}).out, HasSubstr(R"("name": "a\u009bJ\u007f\u001b[",)"));
  EXPECT_EQ(Exported()["networks"][0]["name"], "a\u009bJ\u007f\u001b[");
}

TEST_F(Export, IntoAFileIsReadableByItsOwnerAlone) {
  for (const bool isThere : {false, true}) {
    if (isThere) WriteText(kFile, "old", 0644);
    const Ran ran = Tool({"export", "--secrets", kFile}, {.before = [] { ::umask(0); }});
    EXPECT_EQ(ran.status, 0) << ran.err;
    EXPECT_EQ(ran.out,
              "/tmp/documents/settings.json holds 2 known networks, with their secrets: whoever reads it can "
              "join\n");
    EXPECT_EQ(Shell("stat -c %a /tmp/documents/settings.json; ls -A /tmp/documents"), "600\nsettings.json\n");
    EXPECT_EQ(ReadText(kFile), Tool({"export", "--secrets"}).out);
  }
  library::SavedAp(library::Office());
  EXPECT_EQ(Tool({"export", kFile}).out,
            "/tmp/documents/settings.json holds 2 known networks and the access point's settings, without secrets\n");
  EXPECT_EQ(Tool({"export", kFile, "--json"}).out,
            R"({"result":"ok","export":{"file":"/tmp/documents/settings.json","networks":2,"access_point":true,)"
            R"("secrets":false}})"
            "\n");
  EXPECT_EQ(Tool({"export", kFile, "--porcelain"}).out, "/tmp/documents/settings.json\t2\tyes\tno\n");
}

TEST_F(Export, ReplacesNothingButAPlainFile) {
  std::filesystem::create_symlink("/tmp/elsewhere", kFile);
  const Ran ran = Tool({"export", kFile});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("/tmp/documents/settings.json is no plain file, and was not replaced: "));
  EXPECT_FALSE(std::filesystem::exists("/tmp/elsewhere"));
}

TEST_F(Export, WithoutAnAdapterLeavesTheAccessPointOutAndSaysSo) {
  library::SavedAp(library::Office());
  library::MEROWirelessApConfigSecNameGet = [](char*, size_t) { return FALSE; };
  const Ran ran = Tool({"export"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.err, "merowireless: the access point's settings are left out, since no adapter has been announced\n");
  EXPECT_TRUE(json::parse(ran.out)["access_point"].is_null());
  EXPECT_EQ(json::parse(ran.out)["networks"].size(), 2U);
  EXPECT_EQ(Tool({"export", "--networks"}).err, "");
}

}  // namespace
