// Included inside an interface struct before its table file: makes the
// rows declare pure virtual members. Undone by QnEndMembers.h.
#define QN_PROPERTY QN_DECLARE_PROPERTY
#define QN_NAVIGATION QN_DECLARE_NAVIGATION
#define QN_METHOD QN_DECLARE_METHOD
#define QN_METHOD0 QN_DECLARE_METHOD0
