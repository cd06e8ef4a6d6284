#pragma once
// All host controls and utilities in one include.
#include "hostview/Buttons.h"
#include "hostview/Csv.h"
#include "hostview/CustomTabCtrl.h"
#include "hostview/Edits.h"
#include "hostview/NumberText.h"
#include "hostview/Statics.h"
#include "hostview/StyleRoles.h"
