/* The call interface: handles, statements, values, pools, transactions, and the version-7 calls. Usable from C and C++.
   Names, values, argument orders and types are those of the published interface. */
#ifndef OCI_H
#define OCI_H

#include "oci_types.h"
#include "oci_constants.h"
#include "oci_attributes.h"
#include "oci_functions.h"
#include "oci_values.h"
#include "oci_intervals.h"
#include "oci_nls.h"
#include "oci_services.h"
#include "oci_legacy.h"

#endif
