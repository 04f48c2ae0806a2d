// SPDX-License-Identifier: MIT
//
// registry_bench: one write into the parameter store beside the bare calls of the system's registry, on Windows or under Wine. The
// first peer writes the six values into keys that stay open; the second makes its four keys anew each time, as the write does.
#include <cstdio>
#include <exception>

#include "bench/support/require.h"
#include "bench/support/timing.h"
#include "platform/windows/sdk.h"
#include "preset/parameter_store.h"
#include "preset/store_names.h"

namespace vxcomn::bench {
namespace {

const WideString kBench = WideString(kStoreRoot) + VX_TEXT("\\VxcomnBench");

// The keys of one parameter: that of all parameters, the component, and its three parts.
struct BareKeys {
    HKEY parameters = nullptr, component = nullptr, data = nullptr, source = nullptr, time = nullptr;

    void open(const WideString &path) {
        make(HKEY_LOCAL_MACHINE, path.c_str(), parameters);
        make(parameters, L"3", component);
        make(component, store_name::data, data);
        make(component, store_name::source, source);
        make(component, store_name::time, time);
    }
    void close() {
        for (const HKEY key : {time, source, data, component, parameters}) RegCloseKey(key);
    }
    void write(const std::vector<uint8_t> &value, const GUID &guid) const {
        const uint64_t stamp = freshStamp();
        set(data, L"12", REG_BINARY, value.data(), value.size());
        set(source, L"12", REG_BINARY, &guid, sizeof guid);
        set(time, L"12", REG_QWORD, &stamp, sizeof stamp);
        set(component, store_name::writeTime, REG_QWORD, &stamp, sizeof stamp);
        set(parameters, store_name::writeTime, REG_QWORD, &stamp, sizeof stamp);
    }

  private:
    static void make(HKEY above, const wchar_t *path, HKEY &key) {
        require(RegCreateKeyExW(above, path, 0, nullptr, 0, KEY_ALL_ACCESS, nullptr, &key, nullptr) == 0, "a key can't be made");
    }
    static void set(HKEY key, const wchar_t *name, DWORD type, const void *bytes, size_t size) {
        require(RegSetValueExW(key, name, 0, type, static_cast<const BYTE *>(bytes), static_cast<DWORD>(size)) == 0,
                "a value can't be written");
    }
};

template <class Call>
Work repeated(const char *name, Call call) {
    return {name, [call](int repeats) {
                for (int i = 0; i < repeats; ++i) call();
            }};
}

void printWriteFigures() {
    const std::vector<uint8_t> value(36, 7);
    const GUID guid = {1, 2, 3, {4}};
    const WideString id = VX_TEXT("{00000001-0002-0003-0400-000000000000}");
    const WideString ours = kBench + VX_TEXT("\\Ours"), bare = kBench + VX_TEXT("\\Bare");
    BareKeys kept, made;
    kept.open(bare);
    uint8_t buffer[64];
    const std::vector<Figure> figures = timeInTurns(
        {repeated("write",
                  [&] {
                      uint64_t stamp = 0;
                      require(WriteParameter(nullptr, ours, 3, 12, -1, value, {guid, id}, false, &stamp), "a write failed");
                  }),
         repeated("values", [&] { kept.write(value, guid); }),
         repeated("calls",
                  [&] {
                      made.open(bare);
                      made.write(value, guid);
                      made.close();
                  }),
         repeated("read",
                  [&] {
                      uint32_t size = sizeof buffer;
                      require(ReadParameterValue(ours, 3, 12, buffer, size, nullptr, nullptr) == 0, "a read failed");
                  }),
         repeated("query",
                  [&] {
                      DWORD size = sizeof buffer;
                      require(RegQueryValueExW(kept.data, L"12", nullptr, nullptr, buffer, &size) == 0, "a query failed");
                  })},
        51);
    kept.close();
    const auto ns = [&](const char *name) { return nanosecondsOf(figures, name); };
    printRatio("write a parameter, nobody listening", ns("write"), ns("write") / ns("values"), "five values into open keys");
    printRatio("write a parameter, nobody listening", ns("write"), ns("write") / ns("calls"), "the same keys and values, bare");
    printRatio("read a parameter", ns("read"), ns("read") / ns("query"), "a query of an open key");
}

}  // namespace
}  // namespace vxcomn::bench

int main() {
    using namespace vxcomn::bench;
    int result = 0;
    try {
        printHeading("registry_bench");
        printWriteFigures();
    } catch (const std::exception &error) {
        std::fprintf(stderr, "registry_bench: %s\n", error.what());
        result = 1;
    }
    vxcomn::DeleteRegKeyTree(kBench, false);
    return result;
}
