#include "application_names.h"
