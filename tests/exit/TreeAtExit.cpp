//===-- tests/exit/TreeAtExit.cpp - a deep tree left in a static dies at exit, no overflow -===//
//
// A host keeps trees where they outlive its own code: a view registry in a static, a
// per-thread view in a thread_local. This program leaves a deep, bushy tree in one of
// those and ends; the tree is taken apart during static destruction or thread exit.
// Every level has two children, the one the next level hangs from in front, so the
// teardown has as many chains waiting as the tree is deep. It exits with 0 only when the tree was
// taken apart completely.
//
//   venlomer_tree_at_exit static        the tree in a static, torn down after main
//   venlomer_tree_at_exit thread-local  the tree in a thread_local made before that
//                                       thread's first teardown, torn down at its exit
//
//===------------------------------------------------------------------------------===//
#include "s/TreeNode.h"

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>
#include <thread>

using CommonI::RefCountPtr;
using Vn::Eng::TreeNode;
using VnI::ITreeNode;

namespace {
std::atomic<long> g_live{0}; // allocations through operator new not yet freed
}

void* operator new(std::size_t size) {
    void* p = std::malloc(size == 0 ? 1 : size);
    if (p == nullptr) {
        throw std::bad_alloc();
    }
    g_live.fetch_add(1, std::memory_order_relaxed);
    return p;
}
void operator delete(void* p) noexcept {
    if (p != nullptr) {
        g_live.fetch_sub(1, std::memory_order_relaxed);
        std::free(p);
    }
}
void operator delete(void* p, std::size_t) noexcept {
    operator delete(p);
}

namespace {

constexpr int kLevels = 50000;

// Each level: a leaf and the node the next level hangs from.
RefCountPtr<ITreeNode> BushyTree() {
    auto root = TreeNode::CreateInstance(nullptr, nullptr);
    RefCountPtr<ITreeNode> at = root;
    for (int i = 0; i < kLevels; ++i) {
        auto next = TreeNode::CreateInstance(nullptr, at);
        at->AddChild(TreeNode::CreateInstance(nullptr, at));
        at->AddChild(next); // in front: the leaves behind it wait, one a level
        at = std::move(next);
    }
    return root;
}

// A short-lived tree: its teardown is the thread's first, made before the kept tree dies.
void TearDownASmallTree() {
    auto small = TreeNode::CreateInstance(nullptr, nullptr);
    small->AddChild(TreeNode::CreateInstance(nullptr, small));
}

[[noreturn]] void Fail(const char* what) {
    std::fprintf(stderr, "venlomer_tree_at_exit: %s\n", what);
    std::fflush(stderr);
    std::_Exit(3);
}

// Declared before g_kept, so destroyed after it: checks that the kept tree is gone.
struct AfterTheKeptTree {
    long liveBefore = -1;
    ~AfterTheKeptTree() {
        if (liveBefore >= 0 && g_live.load() > liveBefore) {
            Fail("the tree kept in a static was not taken apart");
        }
    }
} g_check;
RefCountPtr<ITreeNode> g_kept;

struct ThreadView {
    RefCountPtr<ITreeNode> tree;
};

int RunStatic() {
    // Whatever the thread's teardowns used before stays with the thread until it ends.
    BushyTree();
    g_check.liveBefore = g_live.load();
    g_kept = BushyTree();
    TearDownASmallTree();
    return 0;
}

int RunThreadLocal() {
    const long liveBefore = g_live.load();
    std::thread worker([] {
        thread_local ThreadView view; // made before this thread's first teardown
        view.tree = BushyTree();
        TearDownASmallTree();
    });
    worker.join();
    if (g_live.load() > liveBefore) {
        Fail("the tree kept in a thread_local was not taken apart");
    }
    return 0;
}

} // namespace

int main(int argc, char** argv) {
    if (argc == 2 && std::strcmp(argv[1], "static") == 0) {
        return RunStatic();
    }
    if (argc == 2 && std::strcmp(argv[1], "thread-local") == 0) {
        return RunThreadLocal();
    }
    std::fprintf(stderr, "usage: venlomer_tree_at_exit static|thread-local\n");
    return 2;
}
