// CDriverNode: the per-object services every COM object of the driver (the
// root and each child) offers the method frame: its error manager, command
// stack, attribute store and call-context stack, and the session it belongs to.
#pragma once

#include <memory>
#include <string_view>

#include "core/error_manager.h"
#include "core/session_core.h"
#include "io/command_manager.h"
#include "services/cache.h"
#include "services/call_context.h"

namespace qn {

class CDriverNode {
public:
    explicit CDriverNode(std::shared_ptr<SessionCore> core) : core_(std::move(core)) {}
    CDriverNode(const CDriverNode&) = delete;
    CDriverNode& operator=(const CDriverNode&) = delete;

    SessionCore& Core() const { return *core_; }
    const std::shared_ptr<SessionCore>& CorePtr() const { return core_; }
    CErrorManagerBase& Errors() { return errors_; }
    CInstrumentCommandManager& Commands() { return commands_; }
    CCacheManager& Cache() { return cache_; }
    CCallContextManager& CallContexts() { return contexts_; }

    // Class name of the object, e.g. "Quorlen731XX" or "Quorlen731XXChannel".
    virtual std::string_view ComponentName() const = 0;
    // The number the object's SCPI commands carry (analog channel number from
    // 1, digital channel index from 0); negative for objects without one.
    virtual long CommandNumber() const { return -1; }

protected:
    virtual ~CDriverNode() = default;

private:
    std::shared_ptr<SessionCore> core_;
    CErrorManagerBase errors_;
    CInstrumentCommandManager commands_;
    CCacheManager cache_;
    CCallContextManager contexts_;
};

}  // namespace qn
