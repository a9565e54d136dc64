// Both services on a private bus, every method of each called with what no client should send:
// empty arguments, 64 KiB of random bytes, JSON of the wrong type, 10,000-deep nesting, bytes that
// are not UTF-8; then 20 clients calling at once for 10 s. Every call gets an answer (an error
// reply is one), the refused calls change no file, and the daemons' memory stays flat.
#include <gio/gio.h>
#include <gmock/gmock.h>
#include <signal.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "support/gio_call.h"
#include "support/private_bus.h"
#include "support/sim_root.h"

namespace vorn {
namespace test {
namespace {

using Timeout = DaemonProcess::Timeout;

constexpr Timeout kStartTimeout{60000};
constexpr Timeout kCallTimeout{60000};
constexpr int kClients = 20;
constexpr auto kFlood = std::chrono::seconds(10);

struct Method {
    const char* service;
    std::string name;
    int inputs;  // string arguments
};

std::vector<Method> Methods(GDBusConnection* bus, const char* service) {
    GVariant* reply = g_dbus_connection_call_sync(
        bus, service, "/", "org.freedesktop.DBus.Introspectable", "Introspect", nullptr,
        G_VARIANT_TYPE("(s)"), G_DBUS_CALL_FLAGS_NONE, 10000, nullptr, nullptr);
    std::vector<Method> methods;
    if (reply == nullptr) {
        ADD_FAILURE() << "cannot introspect " << service;
        return methods;
    }
    const char* xml = nullptr;
    g_variant_get(reply, "(&s)", &xml);
    GDBusNodeInfo* node = g_dbus_node_info_new_for_xml(xml, nullptr);
    GDBusInterfaceInfo* interface = g_dbus_node_info_lookup_interface(node, service);
    for (GDBusMethodInfo** method = interface->methods; *method != nullptr; ++method) {
        int inputs = 0;
        while ((*method)->in_args[inputs] != nullptr) {
            ++inputs;
        }
        methods.push_back({service, (*method)->name, inputs});
    }
    g_dbus_node_info_unref(node);
    g_variant_unref(reply);
    return methods;
}

// The method's every argument set to input: strings, or byte arrays when bytes is set.
GVariant* Arguments(const Method& method, const std::string& input, bool bytes = false) {
    std::vector<GVariant*> arguments;
    for (int i = 0; i < method.inputs; ++i) {
        arguments.push_back(bytes ? g_variant_new_bytestring(input.c_str())
                                  : g_variant_new_string(input.c_str()));
    }
    return g_variant_new_tuple(arguments.data(), arguments.size());
}

// An answer came: a reply, or an error the service (not the client's timeout) sent.
bool Answered(GDBusConnection* bus, const Method& method, GVariant* arguments) {
    GError* error = nullptr;
    GVariant* reply = g_dbus_connection_call_sync(
        bus, method.service, "/", method.service, method.name.c_str(), arguments, nullptr,
        G_DBUS_CALL_FLAGS_NONE, static_cast<int>(kCallTimeout.count()), nullptr, &error);
    if (reply != nullptr) {
        g_variant_unref(reply);
        return true;
    }
    const bool answered = g_dbus_error_is_remote_error(error);
    g_error_free(error);
    return answered;
}

long PssKilobytes(pid_t pid) {
    std::ifstream in("/proc/" + std::to_string(pid) + "/smaps_rollup");
    for (std::string key; in >> key;) {
        long value = 0;
        if (key == "Pss:" && in >> value) {
            return value;
        }
        in.ignore(1 << 16, '\n');
    }
    return -1;
}

TEST(AbuseTest, BothServicesAnswerEveryHostileCallOfTwentyClients) {
    // The address sanitizer keeps freed memory aside to catch late uses; that is not growth.
    const char* asan = std::getenv("ASAN_OPTIONS");
    SavedVariable options("ASAN_OPTIONS");
    setenv("ASAN_OPTIONS",
           (std::string(asan != nullptr ? asan : "") + ":quarantine_size_mb=1").c_str(), 1);
    PrivateBus bus;
    SimRoot root;
    root.PrepareRadio();
    DaemonProcess netd({VORN_BINARY_DIR "/daemons/vornnetd", "--foreground"});
    ASSERT_TRUE(netd.WaitForBusName("com.tessarin.net", kStartTimeout)) << netd.Stderr();
    DaemonProcess wifid({VORN_BINARY_DIR "/daemons/vornwifid", "--foreground"});
    ASSERT_TRUE(wifid.WaitForBusName("com.tessarin.wifi", kStartTimeout)) << wifid.Stderr();
    // Dropped before the bus goes, which would end this process.
    const std::unique_ptr<GDBusConnection, decltype(&g_object_unref)> connection(
        g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr), g_object_unref);
    GDBusConnection* shared = connection.get();
    ASSERT_NE(shared, nullptr);
    std::vector<Method> methods = Methods(shared, "com.tessarin.net");
    for (const Method& method : Methods(shared, "com.tessarin.wifi")) {
        methods.push_back(method);
    }
    // Methods without arguments do their work, slow or not; only the others can be abused.
    methods.erase(std::remove_if(methods.begin(), methods.end(),
                                 [](const Method& method) { return method.inputs == 0; }),
                  methods.end());
    ASSERT_GT(methods.size(), 20u);

    std::mt19937 random(7);
    std::string noise(64 * 1024, ' ');
    for (char& byte : noise) {
        byte = static_cast<char>(1 + random() % 255);  // a NUL would end the string early
    }
    // A D-Bus string is UTF-8: raw bytes can only come as a byte array.
    gchar* valid = g_utf8_make_valid(noise.c_str(), -1);
    const std::string text = valid;
    g_free(valid);
    std::string deep = "1" + std::string(10000, ']');
    deep.insert(0, std::string(10000, '['));
    const std::vector<std::string> inputs = {
        "",   text, deep,
        "[]", "7",  R"({"ifname":["wlan0"],"type":{},"ssid":7,"enabled":"yes","method":null})"};
    const auto before = root.Files();
    for (const Method& method : methods) {
        for (const std::string& input : inputs) {
            EXPECT_TRUE(Answered(shared, method, Arguments(method, input)))
                << method.name << " " << input.substr(0, 40);
        }
        for (const std::string& bytes : {noise, std::string("\xff\xfe\x80")}) {
            EXPECT_TRUE(Answered(shared, method, Arguments(method, bytes, true)))
                << method.name << " with bytes";
        }
    }
    EXPECT_EQ(root.Files(), before) << "a refused call changed a file";

    const long netdBefore = PssKilobytes(netd.Pid());
    const long wifidBefore = PssKilobytes(wifid.Pid());
    std::atomic<long> calls{0};
    std::atomic<long> unanswered{0};
    std::vector<std::thread> clients;
    const auto end = std::chrono::steady_clock::now() + kFlood;
    for (int client = 0; client < kClients; ++client) {
        clients.emplace_back([&, client] {
            GDBusConnection* own = g_dbus_connection_new_for_address_sync(
                bus.Address().c_str(),
                static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                                  G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
                nullptr, nullptr, nullptr);
            std::mt19937 pick(client);
            while (own != nullptr && std::chrono::steady_clock::now() < end) {
                const Method& method = methods[pick() % methods.size()];
                unanswered +=
                    Answered(own, method, Arguments(method, inputs[pick() % inputs.size()])) ? 0
                                                                                             : 1;
                ++calls;
            }
            unanswered += own == nullptr ? 1 : 0;
            g_clear_object(&own);
        });
    }
    for (std::thread& client : clients) {
        client.join();
    }
    const long netdAfter = PssKilobytes(netd.Pid());
    const long wifidAfter = PssKilobytes(wifid.Pid());
    std::printf(
        "%ld calls of %d clients in %lld s; Pss vornnetd %ld -> %ld kB, vornwifid %ld -> "
        "%ld kB\n",
        calls.load(), kClients, static_cast<long long>(kFlood.count()), netdBefore, netdAfter,
        wifidBefore, wifidAfter);
    EXPECT_EQ(unanswered, 0) << "of " << calls;
    EXPECT_GT(calls, kClients);
    // Flat: the allocators may keep some of what the burst used (the sanitizers' more so), never
    // what thousands of calls asked for.
    EXPECT_LT(netdAfter, netdBefore * 3 / 2);
    EXPECT_LT(wifidAfter, wifidBefore * 3 / 2);
    EXPECT_EQ(root.Files(), before) << "a refused call changed a file";
    // Stopped, each daemon ends well and, in a sanitized build, with nothing to report.
    for (DaemonProcess* daemon : {&netd, &wifid}) {
        EXPECT_TRUE(daemon->Signal(SIGTERM));
        EXPECT_EQ(daemon->WaitForExit(kStartTimeout), 0) << daemon->Stderr();
        EXPECT_THAT(daemon->Stderr(), ::testing::Not(::testing::HasSubstr("Sanitizer")));
    }
}

}  // namespace
}  // namespace test
}  // namespace vorn
