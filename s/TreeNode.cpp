//===-- s/TreeNode.cpp ----------------------------------------------------------===//
#include "Port/UnitStartup.h"

#include "s/TreeNode.h"

#include "s/PropertyHolder.h"
#include "s/TreeNodeItr.h"
#include "s/internal/Shapes.h"
#include "s/internal/TreeLinks.h"
#include "s/internal/TreeNodeRecord.h"

#include <cassert>
#include <utility>
#include <vector>

namespace Vn::Eng {

namespace {
const char kRevision[] = "$Revision: 1.5 $";
const detail::Unit kUnit{"../s/TreeNode", kRevision};
} // namespace

namespace TreeNodeImp {

Record* RecordOf(const TreeNode& node) {
    return node.m_imp;
}

TreeNode* NodeOf(const VnI::ITreeNode* node) {
    const auto* object = dynamic_cast<const TreeNode_ITreeNode*>(node);
    return object != nullptr ? object->GetOwner() : nullptr;
}

namespace {

Record& R(TreeNode* node) {
    return *RecordOf(*node);
}

void AddRef(TreeNode* node) {
    R(node).m_xIRefCount.AddRef();
}
void Release(TreeNode* node) {
    R(node).m_xIRefCount.Release();
}

// --- Weak parent links -------------------------------------------------------------

TreeNode* TrackedParentOf(const Record& r) {
    return static_cast<TreeNode_ITreeNode*>(r.m_parentNode)->GetOwner();
}

void LeaveParentLinks(TreeNode* node) {
    Record& r = R(node);
    if (!r.m_parentTracked) {
        return;
    }
    if (r.m_parentLinksPrev != nullptr) {
        R(r.m_parentLinksPrev).m_parentLinksNext = r.m_parentLinksNext;
    } else {
        R(TrackedParentOf(r)).m_parentLinksHead = r.m_parentLinksNext;
    }
    if (r.m_parentLinksNext != nullptr) {
        R(r.m_parentLinksNext).m_parentLinksPrev = r.m_parentLinksPrev;
    }
    r.m_parentLinksPrev = r.m_parentLinksNext = nullptr;
    r.m_parentTracked = false;
}

void SetParentLink(TreeNode* node, VnI::ITreeNode* parent) {
    Record& r = R(node);
    if (r.m_parentNode == parent) {
        return;
    }
    LeaveParentLinks(node);
    r.m_parentNode = parent;
    if (TreeNode* target = NodeOf(parent)) {
        Record& t = R(target);
        r.m_parentLinksNext = t.m_parentLinksHead;
        if (t.m_parentLinksHead != nullptr) {
            R(t.m_parentLinksHead).m_parentLinksPrev = node;
        }
        t.m_parentLinksHead = node;
        r.m_parentTracked = true;
    }
}

// Called by a dying node: whoever named it as parent now names no one.
void ForgetParent(Record& dying) {
    TreeNode* node = std::exchange(dying.m_parentLinksHead, nullptr);
    while (node != nullptr) {
        Record& r = R(node);
        TreeNode* next = r.m_parentLinksNext;
        r.m_parentNode = nullptr;
        r.m_parentTracked = false;
        r.m_parentLinksPrev = r.m_parentLinksNext = nullptr;
        node = next;
    }
}

// --- Weak holder links -------------------------------------------------------------

void LeaveHolderLinks(TreeNode* node) {
    Record& r = R(node);
    if (!r.m_holderTracked) {
        return;
    }
    if (r.m_holderLinksPrev != nullptr) {
        R(r.m_holderLinksPrev).m_holderLinksNext = r.m_holderLinksNext;
    } else {
        detail::NodesShowing(*static_cast<PropertyHolder*>(r.m_propHolder)) = r.m_holderLinksNext;
    }
    if (r.m_holderLinksNext != nullptr) {
        R(r.m_holderLinksNext).m_holderLinksPrev = r.m_holderLinksPrev;
    }
    r.m_holderLinksPrev = r.m_holderLinksNext = nullptr;
    r.m_holderTracked = false;
}

// Only ever called on a node without a holder: a node's holder is fixed at birth.
void SetHolderLink(TreeNode* node, VnI::IPropertyHolder* holder) {
    Record& r = R(node);
    assert(r.m_propHolder == nullptr && !r.m_holderTracked);
    r.m_propHolder = holder;
    if (auto* base = dynamic_cast<PropertyHolder*>(holder)) {
        TreeNode*& head = detail::NodesShowing(*base);
        r.m_holderLinksNext = head;
        if (head != nullptr) {
            R(head).m_holderLinksPrev = node;
        }
        head = node;
        r.m_holderTracked = true;
    }
}

// --- The sibling chain -------------------------------------------------------------

// Takes node out of the chain it is really linked in, repairing its neighbours and, for a
// first child, the parent. Returns whether node was linked: the chain's reference on it
// then passes to the caller, who must release it.
bool Unlink(TreeNode* node) {
    Record& r = R(node);
    TreeNode* const under = r.m_linkedUnder;
    if (under == nullptr) {
        return false;
    }
    TreeNode* const prev = r.m_prevSibling;
    TreeNode* const next = r.m_nextSibling;
    // The reference node held on next moves to whoever pointed at node.
    if (prev != nullptr) {
        R(prev).m_nextSibling = next;
    } else {
        R(under).m_firshChild = next;
    }
    if (next != nullptr) {
        R(next).m_prevSibling = prev;
    }
    r.m_prevSibling = r.m_nextSibling = nullptr;
    r.m_linkedUnder = nullptr;
    return true;
}

// Links an unlinked node in front of `before` (a child of parent), or in front of every
// child when before is null. Takes one reference on node.
void Link(TreeNode* parent, TreeNode* node, TreeNode* before) {
    Record& p = R(parent);
    Record& n = R(node);
    assert(n.m_linkedUnder == nullptr);
    TreeNode* const next = before != nullptr ? before : p.m_firshChild;
    TreeNode* const prev = next != nullptr ? R(next).m_prevSibling : nullptr;
    // The reference that pointed at next (the parent's or prev's) now points at node, and
    // node holds a new one on next; net, node gains one.
    AddRef(node);
    n.m_nextSibling = next;
    n.m_prevSibling = prev;
    if (prev != nullptr) {
        R(prev).m_nextSibling = node;
    } else {
        p.m_firshChild = node;
    }
    if (next != nullptr) {
        R(next).m_prevSibling = node;
    }
    n.m_linkedUnder = parent;
    SetParentLink(node, &p.m_ITreeNode);
}

// Linking an ancestor under its descendant would make the tree own itself. A node with
// no children is nobody's ancestor, so the usual top-down build pays nothing.
bool IsSelfOrAncestor(TreeNode* candidate, TreeNode* of) {
    if (candidate == of) {
        return true;
    }
    if (R(candidate).m_firshChild == nullptr) {
        return false;
    }
    for (TreeNode* up = R(of).m_linkedUnder; up != nullptr; up = R(up).m_linkedUnder) {
        if (up == candidate) {
            return true;
        }
    }
    return false;
}

// Moves node under parent in front of before (null: in front of every child).
void Move(TreeNode* parent, TreeNode* node, TreeNode* before) {
    AddRef(node); // the old chain may hold the only reference
    const bool wasLinked = Unlink(node);
    Link(parent, node, before);
    if (wasLinked) {
        Release(node);
    }
    Release(node);
}

// --- Destruction without recursion -------------------------------------------------

// Chains whose first node's reference a dying node handed over wait on a list threaded
// through those first nodes' m_prevSibling (a first child has no previous sibling), so
// burying allocates nothing. A node that dies while they are taken apart adds its own
// children here instead of releasing them itself, so the stack stays flat however deep
// or wide the tree.
//
// The per-thread state is two trivially destructible words, constant-initialised: a node
// may die at any moment, during static destruction or thread exit included, and such
// state is never torn down before it, whatever was destroyed first.
constinit thread_local TreeNode* t_buried = nullptr;
constinit thread_local bool t_draining = false;

void Bury(TreeNode* chain) {
    R(chain).m_prevSibling = t_buried;
    t_buried = chain;
    if (t_draining) {
        return; // the outermost teardown on this thread takes it apart
    }
    t_draining = true;
    while (t_buried != nullptr) {
        TreeNode* node = t_buried;
        Record& r = R(node);
        t_buried = r.m_prevSibling;
        r.m_prevSibling = nullptr;
        // Detach node alone; the rest of its chain (with the reference node held on it)
        // waits its turn. Survivors end up as single nodes, out of every chain.
        if (TreeNode* rest = std::exchange(r.m_nextSibling, nullptr)) {
            R(rest).m_prevSibling = t_buried;
            t_buried = rest;
        }
        r.m_linkedUnder = nullptr;
        Release(node);
    }
    t_draining = false;
}

// --- Deep copy ---------------------------------------------------------------------

TreeNode* NewChildCopy(TreeNode* source, TreeNode* parent) {
    CommonI::RefCountPtr<VnI::ITreeNode> parentRef(InterfaceOf(parent));
    if (const auto* group = dynamic_cast<const TreeGroupNode*>(source)) {
        return new TreeGroupNode(group->GetName(), parentRef);
    }
    return new TreeNode(source->GetDataRef(), parentRef);
}

// Copies the children of source below copy, level by level in reverse order, visiting
// the source in depth-first pre-order as a recursive copy would (so that a holder shown
// twice ends up linked to the same copy), but on an explicit stack.
void CopyChildren(const TreeNode& source, TreeNode* copy) {
    struct Frame {
        TreeNode* sourceChild; // next child to copy
        TreeNode* copyParent;
    };
    std::vector<Frame> frames{{RecordOf(source)->m_firshChild, copy}};
    while (!frames.empty()) {
        Frame& top = frames.back();
        TreeNode* child = top.sourceChild;
        if (child == nullptr) {
            frames.pop_back();
            continue;
        }
        top.sourceChild = R(child).m_nextSibling;
        TreeNode* childCopy = NewChildCopy(child, top.copyParent);
        Link(top.copyParent, childCopy, nullptr);
        Release(childCopy); // the chain keeps it
        frames.push_back({R(child).m_firshChild, childCopy});
    }
}

} // namespace
} // namespace TreeNodeImp

void detail::ForgetHolder(TreeNode*& first) {
    using TreeNodeImp::RecordOf;
    TreeNode* node = std::exchange(first, nullptr);
    while (node != nullptr) {
        TreeNodeImp::Record& r = *RecordOf(*node);
        TreeNode* next = r.m_holderLinksNext;
        r.m_propHolder = nullptr;
        r.m_holderTracked = false;
        r.m_holderLinksPrev = r.m_holderLinksNext = nullptr;
        node = next;
    }
}

using TreeNodeImp::NodeOf;

CommonI::RefCountPtr<VnI::ITreeNode>
TreeNode::CreateInstance(VnI::IPropertyHolder* holder,
                         CommonI::RefCountPtr<VnI::ITreeNode> parent) {
    return detail::AdoptCreated<VnI::ITreeNode>(new TreeNode(holder, std::move(parent)));
}

CommonI::RefCountPtr<VnI::ITreeNode>
TreeNode::CreateInstance(CommonI::RefCountPtr<VnI::ITreeNode> node) {
    TreeNode* source = NodeOf(node.Get());
    if (source == nullptr) {
        return nullptr;
    }
    if (const auto* group = dynamic_cast<const TreeGroupNode*>(source)) {
        return detail::AdoptCreated<VnI::ITreeNode>(new TreeGroupNode(*group));
    }
    return detail::AdoptCreated<VnI::ITreeNode>(new TreeNode(*source));
}

TreeNode* TreeNode::FromInterface(const VnI::ITreeNode* node) {
    return NodeOf(node);
}

TreeNode::TreeNode(VnI::IPropertyHolder* holder, CommonI::RefCountPtr<VnI::ITreeNode> parent)
    : m_imp(new TreeNodeImp::Record(this)) {
    TreeNodeImp::SetParentLink(this, parent.Get());
    if (holder != nullptr) {
        TreeNodeImp::SetHolderLink(this, holder);
        holder->SetParentTreeNode(CommonI::RefCountPtr<VnI::ITreeNode>(&m_imp->m_ITreeNode));
    }
}

TreeNode::TreeNode(const TreeNode& other) : m_imp(new TreeNodeImp::Record(this)) {
    m_imp->visible = other.m_imp->visible;
    m_imp->m_selected = other.m_imp->m_selected;
    if (VnI::IPropertyHolder* holder = other.GetDataRef()) {
        TreeNodeImp::SetHolderLink(this, holder);
    }
    TreeNodeImp::CopyChildren(other, this);
}

TreeNode::~TreeNode() {
    using namespace TreeNodeImp;
    Record* r = m_imp;
    ForgetParent(*r);
    LeaveParentLinks(this);
    LeaveHolderLinks(this);
    // A chain counts its nodes, so only a node that was never counted (one built on the
    // stack and linked anyway) can die in one; leave its neighbours consistent.
    Unlink(this);
    // The children are handed over rather than released here, which would recurse.
    TreeNode* children = std::exchange(r->m_firshChild, nullptr);
    delete r;
    m_imp = nullptr;
    if (children != nullptr) {
        Bury(children);
    }
}

std::int64_t TreeNode::AddChild(const CommonI::RefCountPtr<const VnI::ITreeNode>& child) {
    TreeNode* node = NodeOf(child.Get());
    if (node == nullptr || TreeNodeImp::IsSelfOrAncestor(node, this)) {
        return 1;
    }
    TreeNodeImp::Move(this, node, nullptr);
    return 1;
}

std::int64_t TreeNode::InsertChild(const CommonI::RefCountPtr<VnI::ITreeNode>& node,
                                   const CommonI::RefCountPtr<const VnI::ITreeNodeItr>& before) {
    if (!before) {
        return 1;
    }
    const CommonI::RefCountPtr<VnI::ITreeNode> current = before->CurrentItem();
    TreeNode* b = NodeOf(current.Get());
    TreeNode* n = NodeOf(node.Get());
    if (b == nullptr || n == nullptr || b == n || TreeNodeImp::R(b).m_linkedUnder != this ||
        TreeNodeImp::IsSelfOrAncestor(n, this)) {
        return 1;
    }
    TreeNodeImp::Move(this, n, b);
    return 1;
}

std::int64_t TreeNode::RemoveChild(const CommonI::RefCountPtr<VnI::ITreeNodeItr>& at) {
    if (!at) {
        return 1;
    }
    // Step the iterator first so that a loop removing through it stays valid.
    const CommonI::RefCountPtr<VnI::ITreeNode> child = at->CurrentItem();
    at->Next();
    if (TreeNode* node = NodeOf(child.Get())) {
        if (TreeNodeImp::Unlink(node)) {
            TreeNodeImp::Release(node);
        }
    }
    return 1; // `child` goes last: the node dies here when nothing else holds it
}

CommonI::RefCountPtr<VnI::ITreeNodeItr> TreeNode::GetChildren() {
    return TreeNodeItr::CreateInstance(this);
}

bool TreeNode::HasChildren() {
    return m_imp->m_firshChild != nullptr;
}

CommonI::RefCountPtr<VnI::ITreeNode> TreeNode::GetParent() {
    return CommonI::RefCountPtr<VnI::ITreeNode>(m_imp->m_parentNode);
}

void TreeNode::SetParent(CommonI::RefCountPtr<VnI::ITreeNode> parent) {
    TreeNodeImp::SetParentLink(this, parent.Get());
}

VnI::IPropertyHolder* TreeNode::GetDataRef() const {
    return m_imp->m_propHolder;
}

CitI::IInterface* TreeNode::GetInterface(const Port::XUID& id) {
    if (m_imp == nullptr) {
        return nullptr;
    }
    if (id == VnI::IID_ITreeNode || id == CitI::IID_IInterface) {
        return &m_imp->m_ITreeNode;
    }
    if (id == CommonI::IID_IRefCount) {
        return &m_imp->m_xIRefCount;
    }
    return nullptr;
}

void TreeNode::Dump() const {
    using detail::AddressArg;
    const TreeNodeImp::Record* r = m_imp;
    detail::DumpLine(kUnit, 169, "Vn::Eng::TreeNode::m_imp->m_ITreeNode = %x\n",
                     AddressArg(&r->m_ITreeNode));
    detail::DumpLine(kUnit, 170, "Vn::Eng::TreeNode::m_imp->visible = %u\n",
                     static_cast<unsigned int>(r->visible));
    detail::DumpLine(kUnit, 171, "Vn::Eng::TreeNode::m_imp->m_selected = %u\n",
                     static_cast<unsigned int>(r->m_selected));
    detail::DumpLine(kUnit, 172, "Vn::Eng::TreeNode::m_imp->m_prevSibling = %x\n",
                     AddressArg(&r->m_prevSibling));
    detail::DumpLine(kUnit, 173, "Vn::Eng::TreeNode::m_imp->m_nextSibling = %x\n",
                     AddressArg(&r->m_nextSibling));
    detail::DumpLine(kUnit, 174, "Vn::Eng::TreeNode::m_imp->m_firshChild = %x\n",
                     AddressArg(&r->m_firshChild));
    detail::DumpLine(kUnit, 175, "Vn::Eng::TreeNode::m_imp->m_parentNode = %x\n",
                     AddressArg(&r->m_parentNode));
    detail::DumpLine(kUnit, 176, "Vn::Eng::TreeNode::m_imp->m_propHolder = %x\n",
                     AddressArg(&r->m_propHolder));
}

CommonI::RefCountPtr<VnI::ITreeNode>
TreeGroupNode::CreateInstance(const Port::StringBase<char>& name,
                              const CommonI::RefCountPtr<VnI::ITreeNode>& parent) {
    return detail::AdoptCreated<VnI::ITreeNode>(new TreeGroupNode(name, parent));
}

TreeGroupNode::TreeGroupNode(const Port::StringBase<char>& name,
                             const CommonI::RefCountPtr<VnI::ITreeNode>& parent)
    : TreeNode(nullptr, parent), m_name(new Port::StringBase<char>(name)) {}

TreeGroupNode::TreeGroupNode(const TreeGroupNode& other)
    : TreeNode(other), m_name(new Port::StringBase<char>(*other.m_name)) {}

TreeGroupNode::~TreeGroupNode() {
    delete m_name;
}

Port::StringBase<char> TreeGroupNode::GetName() const {
    return *m_name;
}

} // namespace Vn::Eng
