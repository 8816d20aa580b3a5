// The child classes of the repeated capabilities. Each instance is a COM
// object with its own per-object services, a name and a 1-based position,
// and belongs to the session of the root that built it.
#pragma once

#include <memory>
#include <optional>
#include <string>

#include "core/node.h"
#include "core/ties.h"

namespace qn {

template <class Child, class Itf>
class CObjectModelChildNode : public com::ComObject<Child, Tie<Itf, Child>, ISupportErrorInfo>,
                              public CDriverNode {
public:
    using ElementInterface = Itf;

    CObjectModelChildNode(std::shared_ptr<SessionCore> core, std::string name, long position)
        : CDriverNode(std::move(core)), name_(std::move(name)), position_(position) {}

    const std::string& Name() const { return name_; }
    long Position() const { return position_; }

    HRESULT InterfaceSupportsErrorInfo(REFIID riid) override {
        return riid == iid_of<Itf> ? S_OK : S_FALSE;
    }

    // Session notifications from the root.
    virtual void OnSessionEnd() {}
    // The instrument was reset: simulated values return to their defaults.
    virtual void OnReset() { Cache().InvalidateAll(); }

private:
    std::string name_;
    long position_;
};

// Class-compliant analog channel: every member forwards to the user
// channel of the same position.
class Quorlen731XXChannel final
    : public CObjectModelChildNode<Quorlen731XXChannel, IIviScopeChannel> {
public:
    using CObjectModelChildNode::CObjectModelChildNode;
    std::string_view ComponentName() const override { return "Quorlen731XXChannel"; }
    long CommandNumber() const override { return Position(); }
    IQuorlen731XXChannel* Counterpart(IIviScopeChannel*);
#include "core/member_entries_begin.h"
#include "members/IIviScopeChannel.def"
#include "QnEndMembers.h"
};

// Instrument-specific analog channel.
class Quorlen731XXUserChannel final
    : public CObjectModelChildNode<Quorlen731XXUserChannel, IQuorlen731XXChannel> {
public:
    using CObjectModelChildNode::CObjectModelChildNode;
    std::string_view ComponentName() const override { return "Quorlen731XXUserChannel"; }
    long CommandNumber() const override { return Position(); }
    void OnReset() override;
#include "core/member_entries_begin.h"
#include "members/IQuorlen731XXChannel.def"
#include "QnEndMembers.h"

    // The probe attenuation last written or read; -1 selects automatic
    // sensing. Unset on a new channel.
    std::optional<double> last_probe_attenuation;
};

// Class-compliant waveform measurement of one channel.
class Quorlen731XXMeasurement final
    : public CObjectModelChildNode<Quorlen731XXMeasurement, IIviScopeMeasurement> {
public:
    using CObjectModelChildNode::CObjectModelChildNode;
    std::string_view ComponentName() const override { return "Quorlen731XXMeasurement"; }
    long CommandNumber() const override { return Position(); }
    IQuorlen731XXMeasurement* Counterpart(IIviScopeMeasurement*);
#include "core/member_entries_begin.h"
#include "members/IIviScopeMeasurement.def"
#include "QnEndMembers.h"
};

// Instrument-specific measurement of one source (channel, user channel or
// digital channel, by name).
class Quorlen731XXUserMeasurement final
    : public CObjectModelChildNode<Quorlen731XXUserMeasurement, IQuorlen731XXMeasurement> {
public:
    using CObjectModelChildNode::CObjectModelChildNode;
    std::string_view ComponentName() const override { return "Quorlen731XXUserMeasurement"; }
#include "core/member_entries_begin.h"
#include "members/IQuorlen731XXMeasurement.def"
#include "QnEndMembers.h"
};

// Digital channel; its commands carry the zero-based index.
class Quorlen731XXUserDigitalChannel final
    : public CObjectModelChildNode<Quorlen731XXUserDigitalChannel, IQuorlen731XXDigitalChannel> {
public:
    using CObjectModelChildNode::CObjectModelChildNode;
    std::string_view ComponentName() const override { return "Quorlen731XXUserDigitalChannel"; }
    long CommandNumber() const override { return Position() - 1; }
#include "core/member_entries_begin.h"
#include "members/IQuorlen731XXDigitalChannel.def"
#include "QnEndMembers.h"
};

}  // namespace qn
