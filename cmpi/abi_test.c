/* The headers as a C program sees them: sizes, offsets, types and values, every macro that calls a slot, and a provider
 * made with the CM...MIStub macros. A difference from cmpi-abi.json does not compile. */

#include <stddef.h>

#include "cmpidt.h"
#include "cmpift.h"
#include "cmpimacs.h"
#include "cmpios.h"
#include "cmpipl.h"

static const CMPIBroker* cBroker;

const CMPIBroker* cProviderBroker(void);
const CMPIBroker* cProviderBroker(void) { return cBroker; }

/* Version 1.0 lacks what much of this is about. */
#ifdef CMPI_VER_200
#include "abi_c.inc"
#endif
