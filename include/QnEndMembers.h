// Ends a use of a member table (see QnDeclareMembers.h).
#undef QN_PROPERTY
#undef QN_NAVIGATION
#undef QN_METHOD
#undef QN_METHOD0
