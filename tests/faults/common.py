"""What the scripts that let a command's calls to the file system go wrong have in common."""
import os, plistlib, stat, subprocess

page = "Chapters/One/Pages/A.marletpage/Contents.swift"


def marlet_of(path, faults):
    """A function that runs the command, quietly and with the faults that the settings ask for."""
    def run(arguments, wait=True, preexec_fn=None, **settings):
        environment = {**os.environ, **settings}
        if settings:
            environment["LD_PRELOAD"] = faults
        command = [path, "-q", *arguments]
        if wait:
            return subprocess.run(command, env=environment, stdin=subprocess.DEVNULL, capture_output=True, preexec_fn=preexec_fn)
        return subprocess.Popen(command, env=environment, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)

    return run


def state(directory):
    """Everything of a document that counts."""
    items = {}
    for folder, folders, files in os.walk(directory):
        for name in folders + files:
            path = os.path.join(folder, name)
            mode = os.lstat(path).st_mode
            content = os.readlink(path) if stat.S_ISLNK(mode) else open(path, "rb").read() if stat.S_ISREG(mode) else None
            items[os.path.relpath(path, directory)] = (mode, content)
    return items


def write(path, content):
    os.makedirs(os.path.dirname(path), exist_ok=True)
    with open(path, "wb") as file:
        file.write(content if isinstance(content, bytes) else plistlib.dumps(content))


def make_book(marlet, directory):
    """A small book whose learner has edited a page, with a link and a mode of its own."""
    contents = f"{directory}/Contents"
    write(f"{contents}/Manifest.plist", {"Version": "1.0", "Name": "Faults", "ContentIdentifier": "org.example.faults",
                                         "ContentVersion": "1.0.0", "DeploymentTarget": "slateos9.0", "Chapters": ["One"]})
    write(f"{contents}/Chapters/One/Manifest.plist", {"Name": "One", "Pages": ["A.marletpage"]})
    write(f"{contents}/Chapters/One/Pages/A.marletpage/Manifest.plist", {"Name": "A"})
    write(f"{contents}/{page}", b"// Greets a ship.\n//#-editable-code\ngreet(\"Good morning\", 3)\n//#-end-editable-code\n")
    write(f"{contents}/Resources/old.txt", b"old\n")
    os.symlink("nowhere", f"{contents}/link")
    os.chmod(f"{contents}/{page}", 0o640)
    write(f"{directory}/edited.swift", b"// Greets a ship.\n//#-editable-code\ngreet(\"Good morning\", 9)\n//#-end-editable-code\n")
    write(f"{directory}/Edits/UserResources/drawing.png", b"a learner's drawing")
    write(f"{directory}/Edits/KeyValueStore.plist", {"Version": "1.0", "Contents": {"score": 3}})
    assert marlet(["edit", directory, "--set", f"{page}={directory}/edited.swift", "--set",
                       f"Resources/own.txt={directory}/edited.swift"]).returncode == 0
    os.remove(f"{directory}/edited.swift")


def change(path, before, after):
    with open(path) as file:
        text = file.read()
    assert before in text, (path, before)
    with open(path, "w") as file:
        file.write(text.replace(before, after, 1))
