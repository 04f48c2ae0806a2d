// SPDX-License-Identifier: MIT
#include "tools/vx_client/writer.h"

#include "platform/guid.h"
#include "platform/named_mutex.h"

namespace vx::client {

namespace {

constexpr const char *kGlobal = "Global\\";

Writer clientOf(const std::string &id) {
    const bool alive = vxcomn::NamedMutex::exists(vxcomn::toWide(kGlobal + id));
    return {alive ? WriterKind::client : WriterKind::gone, id};
}

const char *kindName(WriterKind kind) {
    switch (kind) {
        case WriterKind::preset:
            return "preset";
        case WriterKind::self:
            return "self";
        case WriterKind::client:
            return "client";
        case WriterKind::gone:
            return "gone";
        default:
            return "unknown";
    }
}

}  // namespace

std::string guidText(const GUID &guid) {
    return vxcomn::toUtf8(vxcomn::guidText(guid));
}

Writer writerOf(const GUID &source, const GUID &self) {
    if (source == GUID{}) return {WriterKind::preset, {}};
    if (source == self) return {WriterKind::self, guidText(source)};
    return clientOf(guidText(source));
}

Writer setterOf(const std::string &setter) {
    if (setter.empty()) return {};
    return clientOf(setter.starts_with(kGlobal) ? setter.substr(std::string(kGlobal).size()) : setter);
}

std::string writerText(const Writer &writer) {
    switch (writer.kind) {
        case WriterKind::preset:
            return "the preset";
        case WriterKind::self:
            return "this program";
        case WriterKind::client:
            return "client " + printable(writer.id);
        case WriterKind::gone:
            return "client " + printable(writer.id) + ", who has ended";
        default:
            return "somebody";
    }
}

Json writerJson(const Writer &writer) {
    return {{"kind", kindName(writer.kind)}, {"id", textOrNull(writer.id)}};
}

}  // namespace vx::client
