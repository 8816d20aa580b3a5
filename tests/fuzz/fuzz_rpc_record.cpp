// RPC record marking and reply/call parsing on arbitrary bytes: the stream is
// cut at a size taken from the input, every record parsed as reply and call.
#include <cstddef>
#include <cstdint>
#include <string>

#include "platform/visa/onc_rpc.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 1) return 0;
    const std::size_t chunk = 1 + data[0] % 17;
    std::string_view stream(reinterpret_cast<const char*>(data + 1), size - 1);
    qn::rpc::RecordReader reader(4096);
    std::string record;
    for (std::size_t off = 0; off < stream.size(); off += chunk) {
        std::string_view in = stream.substr(off, chunk);
        for (;;) {
            const auto st = reader.Feed(&in, &record);
            if (st != qn::rpc::RecordReader::Status::kRecord) break;
            if (record.size() > 4096) __builtin_trap();
            std::uint32_t xid = 0;
            qn::rpc::AcceptStat stat{};
            std::string_view results;
            qn::rpc::ParseReply(record, &xid, &stat, &results);
            qn::rpc::CallHeader call;
            std::string_view args;
            if (qn::rpc::ParseCall(record, &call, &args)) {
                qn::rpc::XdrReader r(args);
                std::string_view item;
                while (r.Opaque(&item, 1024)) {
                }
            }
        }
    }
    return 0;
}
