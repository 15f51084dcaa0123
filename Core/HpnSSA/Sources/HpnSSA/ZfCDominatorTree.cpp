#include "ZfCDominatorTree.h"

ZfCDominatorTree::ZfCDominatorTree() : m_pRoot(nullptr) {
}

ZfCDominatorTree::ZfCDominatorTree(ZfCDominatorTree const& Other) = default;

ZfCDominatorTree& ZfCDominatorTree::operator=(ZfCDominatorTree const& Other) = default;

ZfCDominatorTree::~ZfCDominatorTree() = default;

leda::node ZfCDominatorTree::getRoot() {
    return m_pRoot;
}

void ZfCDominatorTree::setRoot(leda::node Root) {
    m_pRoot = Root;
}
