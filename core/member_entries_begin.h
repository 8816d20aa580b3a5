// Inside a class declaration, before a table file: the rows declare the
// class's entries and custom bodies. Ended by QnEndMembers.h.
#define QN_PROPERTY QN_ENTRY_PROPERTY
#define QN_NAVIGATION QN_ENTRY_NAVIGATION
#define QN_METHOD QN_ENTRY_METHOD
#define QN_METHOD0 QN_ENTRY_METHOD0
