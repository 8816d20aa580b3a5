// Holds one operation of a session open for the lifetime of the scope, so
// that all the reads and writes made within it share one deadline
// (IMessageDirect::BeginOperation).
#pragma once

#include "platform/visa/visa.h"

namespace qn::visa {

class OperationScope {
  public:
    explicit OperationScope(IMessageDirect* direct)
        : direct_(direct && direct->BeginOperation() == S_OK ? direct : nullptr) {}
    ~OperationScope() {
        if (direct_) direct_->EndOperation();
    }
    OperationScope(const OperationScope&) = delete;
    OperationScope& operator=(const OperationScope&) = delete;

  private:
    IMessageDirect* direct_;
};

}  // namespace qn::visa
