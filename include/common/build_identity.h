#pragma once

// Build identity of the executable. Preprocessor definitions only: the resource
// compiler includes this file too.
#define VSS_REQUESTOR_BUILD 2769
#define VSS_REQUESTOR_VERSION 4, 7, 0, 2769
#define VSS_REQUESTOR_VERSION_TEXT "4.7.0.2769"
#define VSS_REQUESTOR_MODULE_TAG "vss_requestor_vsa64_s_2769"
