#include "network/module/upnpscanner.h"

#include <gmock/gmock.h>

#include <string>

#include "support/log_capture.h"

namespace vornnetwork::network::module {
namespace {

std::string Document(const std::string& device) {
    return "<?xml version=\"1.0\"?><root xmlns=\"urn:schemas-upnp-org:device-1-0\">"
           "<specVersion><major>1</major><minor>0</minor></specVersion><device>" +
           device + "</device></root>";
}

TEST(UpnpScannerTest, DescriptionsGiveTheFirstOfEachNameCleanedAndBounded) {
    Json::Value device;
    ASSERT_TRUE(UpnpScanner::DescribeDevice(
        Document("<deviceType>urn:schemas-upnp-org:device:MediaServer:1</deviceType>"
                 "<friendlyName> Living &amp; room\n</friendlyName><manufacturer>Justin Maggard"
                 "</manufacturer><modelName>Windows Media Connect compatible (MiniDLNA)"
                 "</modelName><deviceList><device><friendlyName>embedded</friendlyName>"
                 "</device></deviceList>"),
        device));
    EXPECT_EQ(device["friendlyName"], "Living & room");
    EXPECT_EQ(device["modelDescription"], "");
    EXPECT_EQ(device.size(), 5u);

    // Hostile texts: control characters, no text at all, far too long.
    ASSERT_TRUE(UpnpScanner::DescribeDevice(
        Document("<friendlyName>\ta&#x7f;b\r\nc\xc3\xa9 </friendlyName>"
                 "<modelName><b>bold</b></modelName><manufacturer>" +
                 std::string(300, 'm') + "</manufacturer><modelDescription>" +
                 std::string(255, 'd') + "\xc3\xa9</modelDescription>"),
        device));
    EXPECT_EQ(device["friendlyName"], "a b  c\xc3\xa9");
    EXPECT_EQ(device["modelName"], "");
    EXPECT_EQ(device["manufacturer"], std::string(256, 'm'));
    // A character that would not fit whole is left out, not cut.
    EXPECT_EQ(device["modelDescription"], std::string(255, 'd'));

    // ixml refuses what is not well-formed UTF-8 XML: nothing is described.
    for (const std::string& bad :
         {std::string("<root><device><friendlyName>x</device></root>"), std::string(),
          std::string("<root/>x"),
          Document("<friendlyName>" + std::string(70000, 'x') + "</friendlyName>")}) {
        EXPECT_FALSE(UpnpScanner::DescribeDevice(bad, device)) << bad.substr(0, 40);
    }
}

TEST(UpnpScannerTest, AnswersWithoutAnHttpLocationAreSkippedWithoutADownload) {
    vorn::test::LogCapture log;
    UpnpScanner* scanner = UpnpScanner::Inst();
    scanner->HandleDiscovery("192.0.2.7", "file:///etc/passwd");
    scanner->HandleDiscovery("192.0.2.7", "http://192.0.2.7/" + std::string(2000, 'x'));
    scanner->HandleDiscovery("", "http://192.0.2.7/rootDesc.xml");
    EXPECT_EQ(log.Matching("Skipped upnp answer").size(), 3u);
    EXPECT_TRUE(scanner->GetClientList()["ClientList"].empty());
}

}  // namespace
}  // namespace vornnetwork::network::module
