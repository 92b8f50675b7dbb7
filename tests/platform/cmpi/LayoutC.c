/* The binary layout of the CMPI headers, as C sees it. A wrong row does not
 * compile; the function exists so that the test runner can report the check. */
#include <cmpift.h>

#define LAYOUT_SIZE(type, bytes) _Static_assert(sizeof(type) == (bytes), #type);
#define LAYOUT_OFFSET(type, member, bytes) \
    _Static_assert(offsetof(type, member) == (bytes), #type "." #member);
#include "layout.inc"
#undef LAYOUT_SIZE
#undef LAYOUT_OFFSET

#define LAYOUT_SIZE(type, bytes) +1
#define LAYOUT_OFFSET(type, member, bytes) +1
int layoutRowsCheckedAsC(void);
int layoutRowsCheckedAsC(void) {
    return 0
#include "layout.inc"
        ;
}
