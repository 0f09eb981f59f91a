/// Prints a page's verdict: praise for a solution, otherwise a hint that leads on.
public func check(_ solved: Bool, praise: String, hint: String) {
    print(solved ? "Solved! \(praise)" : "Not yet. \(hint)")
}
