#ifndef LEDA_LEDA_H
#define LEDA_LEDA_H

// The whole graph and container layer.
#include "LEDA/allocator.h"
#include "LEDA/array.h"
#include "LEDA/compare.h"
#include "LEDA/dictionary.h"
#include "LEDA/error.h"
#include "LEDA/graph.h"
#include "LEDA/graph_alg.h"
#include "LEDA/h_array.h"
#include "LEDA/list.h"
#include "LEDA/map.h"
#include "LEDA/node_array.h"
#include "LEDA/set.h"
#include "LEDA/slist.h"
#include "LEDA/tuple.h"

#endif
