// The cases the transport benchmarks share, against the emulator in this
// process (raw socket, VXI-11 and HiSLIP servers):
// - "*IDN?" round trip through IMessage (WriteString + ReadString);
// - a 2,000,000-byte definite-length block through
//   IFormattedIO488Direct::ReadIEEEBlockInto into a reused buffer.
// A session with termchar set ends messages at the line feed (raw socket);
// the others end them at END.
#pragma once

#include <benchmark/benchmark.h>

#include <string>
#include <vector>

#include "emulator/emulator.h"
#include "platform/visa/visa.h"

namespace qn::bench {

inline constexpr std::size_t kBlockBytes = 2000000;

inline qn::emu::Emulator& TheEmulator() {
    static qn::emu::Emulator* emu = [] {
        auto* e = new qn::emu::Emulator("QDS4032A");
        e->EnableVxi11();
        e->EnableHislip();
        e->Start();
        std::string block = "#7" + std::to_string(kBlockBytes);
        for (std::size_t i = 0; i < kBlockBytes; ++i) block += char(i * 7);  // line feeds too
        e->ServeWaveformData(std::move(block));
        e->SetLogLimit(16);
        return e;
    }();
    return *emu;
}

inline ComPtr<IMessage> OpenMessage(const std::string& resource, bool termchar) {
    ComPtr<IResourceManager> rm;
    qn::visa::CreateResourceManager(rm.Out());
    ComPtr<IVisaSession> s;
    rm->Open(qn::com::Bstr(resource).get(), qn::visa::kNoLock, 2000, nullptr, s.Out());
    ComPtr<IMessage> msg;
    if (s) s.As(msg);
    if (msg && termchar) msg->put_TerminationCharacterEnabled(VARIANT_TRUE);
    return msg;
}

inline void IdnCase(benchmark::State& state, const std::string& resource, bool termchar) {
    auto msg = OpenMessage(resource, termchar);
    if (!msg) return state.SkipWithError("open failed");
    qn::com::Bstr query("*IDN?\n");
    for (auto _ : state) {
        LONG written = 0;
        msg->WriteString(query.get(), &written);
        qn::com::Bstr reply;
        if (FAILED(msg->ReadString(1024, reply.Out()))) state.SkipWithError("read failed");
    }
}

inline void BlockCase(benchmark::State& state, const std::string& resource, bool termchar) {
    auto msg = OpenMessage(resource, termchar);
    if (!msg) return state.SkipWithError("open failed");
    ComPtr<IFormattedIO488> io;
    qn::visa::CreateFormattedIO488(io.Out());
    io->put_IO(msg.get());
    ComPtr<IFormattedIO488Direct> direct;
    io.As(direct);
    const qn::com::Bstr query(":WAV:DATA?\n");
    std::vector<BYTE> dst(kBlockBytes);
    for (auto _ : state) {
        LONG written = 0, actual = 0;
        msg->WriteString(query.get(), &written);
        if (FAILED(direct->ReadIEEEBlockInto(qn::visa::BinaryType_UI1, dst.data(), LONG(dst.size()),
                                             &actual, VARIANT_FALSE, VARIANT_TRUE)))
            state.SkipWithError("block read failed");
    }
    state.SetBytesProcessed(state.iterations() * std::int64_t(kBlockBytes));
}

}  // namespace qn::bench
