// In a source file, after defining QN_CLASS and before a table file: the
// rows define the class's entries. Ended by QnEndMembers.h.
#define QN_PROPERTY QN_DEFINE_PROPERTY
#define QN_NAVIGATION QN_DEFINE_NAVIGATION
#define QN_METHOD QN_DEFINE_METHOD
#define QN_METHOD0 QN_DEFINE_METHOD0
