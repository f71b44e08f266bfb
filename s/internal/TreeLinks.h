//===-- s/internal/TreeLinks.h - the weak back links between holders and nodes --===//
//
// \file
// A node never keeps its holder alive, yet it must never answer a holder that is gone.
// Every node that shows a Vn::Eng::PropertyHolder is therefore threaded on an intrusive
// list whose head lives in the holder's record: linking and unlinking cost O(1), and a
// dying holder visits exactly the nodes that point at it. Holders that implement
// VnI::IPropertyHolder without deriving from PropertyHolder have no such list; nodes keep
// a plain pointer to them and their owners must outlive the nodes.
//
//===------------------------------------------------------------------------------===//
#pragma once

namespace Vn::Eng {
class PropertyHolder;
class TreeNode;
} // namespace Vn::Eng

namespace Vn::Eng::detail {

/// The first node of the list of nodes that show `holder` (defined with the holder).
TreeNode*& NodesShowing(PropertyHolder& holder);

/// Tells every node of the list that its holder is gone, and empties the list (defined
/// with the node).
void ForgetHolder(TreeNode*& first);

} // namespace Vn::Eng::detail
