/* The shared driver library is made of the whole driver archive; CMake wants
 * one source of the library's own, and this is it. */
typedef int qn_module_anchor;
