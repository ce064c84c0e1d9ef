// Umbrella header of the timing-specification database.
#pragma once

#include "tsd/host/DumpStream.h"
#include "tsd/host/Messages.h"

#include "tsd/Tsd_Annotator.h"
#include "tsd/Tsd_BaseObj.h"
#include "tsd/Tsd_Builder.h"
#include "tsd/Tsd_Design.h"
#include "tsd/Tsd_Groups.h"
#include "tsd/Tsd_Parsers.h"
#include "tsd/Tsd_Specs.h"
#include "tsd/Tsd_StaticBuf.h"
