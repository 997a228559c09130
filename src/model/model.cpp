#include "model/model.h"

int model::modelcount = 0;
