// Inside a Tie<Interface, Impl> specialisation, before a table file: the rows
// override the interface's members. Ended by QnEndMembers.h.
#define QN_PROPERTY QN_TIE_PROPERTY
#define QN_NAVIGATION QN_TIE_NAVIGATION
#define QN_METHOD QN_TIE_METHOD
#define QN_METHOD0 QN_TIE_METHOD0
