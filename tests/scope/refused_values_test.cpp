// Values outside their set and texts that would break a command are refused
// by the method frame before anything is stored or sent: with an instrument
// nothing reaches the wire, in simulation a read returns what it returned
// before.
#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "tests/scope/scope_fixture.h"

namespace qn::test {
namespace {

using Call = std::function<HRESULT(Quorlen731XX&)>;
// Reads the member's value back as text (simulation only); null for methods.
using Read = std::function<std::string(Quorlen731XX&)>;

template <class Itf, class T>
Read ReadOf(HRESULT (Itf::*get)(T*)) {
    return [get](Quorlen731XX& d) {
        if constexpr (std::is_same_v<T, BSTR>) {
            com::Bstr s;
            EXPECT_EQ((static_cast<Itf*>(&d)->*get)(s.Out()), S_OK);
            return s.utf8();
        } else {
            T v{};
            EXPECT_EQ((static_cast<Itf*>(&d)->*get)(&v), S_OK);
            return std::to_string(static_cast<long>(v));
        }
    };
}

ComPtr<IQuorlen731XXChannel> UserChannel1(Quorlen731XX& d) {
    return ChannelNamed<IQuorlen731XXChannels, IQuorlen731XXChannel>(d, "UserChannel1");
}

struct Case {
    const char* what;
    const char* entry;  // named in the error text
    Call call;
    Read read;
};

const Case kCases[] = {
    {"enumeration above its set", "put_SignalFormat",
     [](Quorlen731XX& d) {
         return static_cast<IQuorlen731XXTriggerTv*>(&d)->put_SignalFormat(
             static_cast<Quorlen731XXTVSignalFormatEnum>(10));
     },
     ReadOf(&IQuorlen731XXTriggerTv::get_SignalFormat)},
    {"enumeration below its set", "put_Interpolation",
     [](Quorlen731XX& d) {
         return static_cast<IQuorlen731XXAcquisition*>(&d)->put_Interpolation(
             static_cast<Quorlen731XXInterpolationEnum>(0));
     },
     ReadOf(&IQuorlen731XXAcquisition::get_Interpolation)},
    {"class value only the driver enumeration has", "put_Slope",
     [](Quorlen731XX& d) {
         return static_cast<IIviScopeTriggerEdge*>(&d)->put_Slope(
             static_cast<IviScopeTriggerSlopeEnum>(Quorlen731XXTriggerSlopeEither));
     },
     ReadOf(&IIviScopeTriggerEdge::get_Slope)},
    {"enumeration parameter of a method", "Configure",
     [](Quorlen731XX& d) {
         com::Bstr source("UserChannel1");
         return static_cast<IQuorlen731XXTriggerTv*>(&d)->Configure(
             source.get(), static_cast<Quorlen731XXTVSignalFormatEnum>(-1),
             Quorlen731XXTVEventField1, Quorlen731XXTVTriggerPositive);
     },
     ReadOf(&IQuorlen731XXTrigger::get_Type)},
    {"line feed in a property text", "put_Source",
     [](Quorlen731XX& d) {
         com::Bstr source("UserChannel1\n*RST");
         return static_cast<IQuorlen731XXTrigger*>(&d)->put_Source(source.get());
     },
     ReadOf(&IQuorlen731XXTrigger::get_Source)},
    {"NUL in a property text", "put_Date",
     [](Quorlen731XX& d) {
         com::Bstr date(std::u16string_view(u"+2020,+1\0*RST", 13));
         return static_cast<IQuorlen731XXSystem*>(&d)->put_Date(date.get());
     },
     ReadOf(&IQuorlen731XXSystem::get_Date)},
    {"line feed in a command parameter", "SaveState",
     [](Quorlen731XX& d) {
         com::Bstr id("1\n*RST");
         return static_cast<IQuorlen731XXSystem*>(&d)->SaveState(id.get());
     },
     nullptr},
    {"line feed in a channel's text", "put_Label",
     [](Quorlen731XX& d) {
         com::Bstr label("A\nB");
         return UserChannel1(d)->put_Label(label.get());
     },
     [](Quorlen731XX& d) {
         com::Bstr s;
         EXPECT_EQ(UserChannel1(d)->get_Label(s.Out()), S_OK);
         return s.utf8();
     }},
};

using RefusedValues = ScriptedScopeTest;

TEST_F(RefusedValues, NothingIsSentToTheInstrument) {
    Open("73141D");
    for (const Case& c : kCases) {
        SCOPED_TRACE(c.what);
        const std::size_t written = io_->Written().size();
        EXPECT_EQ(c.call(*driver_.get()), E_IVI_INVALID_VALUE);
        EXPECT_NE(ErrorText().find(c.entry), std::string::npos);
        EXPECT_EQ(io_->Written().size(), written);
    }
}

TEST_F(RefusedValues, NothingIsStoredInSimulation) {
    driver_ = SimulatedDriver("QMS4104B");
    for (const Case& c : kCases) {
        SCOPED_TRACE(c.what);
        const std::string before = c.read ? c.read(*driver_.get()) : "";
        EXPECT_EQ(c.call(*driver_.get()), E_IVI_INVALID_VALUE);
        EXPECT_NE(ErrorText().find(c.entry), std::string::npos);
        if (c.read) {
            EXPECT_EQ(c.read(*driver_.get()), before);
        }
    }
}

}  // namespace
}  // namespace qn::test
