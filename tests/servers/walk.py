#!/usr/bin/python3
"""Walks a CIM server that has the module: every served class, its instances, what associations join to them.

    walk.py URL INTEROP-NAMESPACE [WALKS] [USER PASSWORD]

WALKS is the number of instances of each class whose associations are followed (3). Needs pywbem. Prints the counts and
each complaint; exits with 1 when there is any.
"""
import sys

import pywbem

ASSOCIATION_LIMIT = 3
NAMESPACE = "root/tavrin"
NOT_SERVED = (pywbem.CIM_ERR_NOT_SUPPORTED, pywbem.CIM_ERR_INVALID_CLASS)


class Walk:
    def __init__(self, connection, interop, walks):
        self.connection = connection
        self.namespaces = (NAMESPACE, interop)
        self.walks = walks
        self.instances = 0
        self.followed = 0
        self.complaints = []

    def attempt(self, what, operation, *arguments, **options):
        try:
            return operation(*arguments, **options)
        except pywbem.CIMError as error:
            if error.status_code not in NOT_SERVED:
                self.complaints.append(f"{what}: {error}")
        except pywbem.Error as error:
            self.complaints.append(f"{what}: {type(error).__name__}: {error}")
        return []

    def walk_class(self, name, namespace):
        paths = self.attempt(f"names of {name}", self.connection.EnumerateInstanceNames, name, namespace)
        own = [path for path in paths if path.classname.lower() == name.lower()]
        for path in own:
            one = self.attempt(f"{path}", self.connection.GetInstance, path)
            if one and one.path != path:
                self.complaints.append(f"{path} is answered as {one.path}")
        whole = self.attempt(name, self.connection.EnumerateInstances, name, namespace)
        if len([i for i in whole if i.classname.lower() == name.lower()]) != len(own):
            self.complaints.append(f"{name}: {len(own)} names, {len(whole)} instances")
        self.instances += len(own)
        for path in own[: self.walks]:
            self.follow(path)

    def follow(self, path):
        """Associators lead to instances that are there; those of a platform may be nobody's."""
        self.followed += 1
        joined = self.attempt(f"associators of {path}", self.connection.AssociatorNames, path)
        references = self.attempt(f"references of {path}", self.connection.ReferenceNames, path)
        if joined and not references:
            self.complaints.append(f"{path} has associators and no references")
        for other in [path for path in joined if path.classname.startswith("TVRHBA_")][: self.walks]:
            self.attempt(f"{other}, associator of {path}", self.connection.GetInstance, other)

    def walk(self):
        for namespace in self.namespaces:
            names = self.attempt(
                f"classes of {namespace}", self.connection.EnumerateClassNames, namespace, DeepInheritance=True
            )
            for name in sorted(n for n in names if n.startswith("TVRHBA_")):
                self.walk_class(name, namespace)


def profiles(connection):
    """Profiles with the number of their central instances; OpenPegasus keeps their associations to itself."""
    server = pywbem.WBEMServer(connection)
    found = {}
    for profile in server.profiles:
        try:
            found[profile["RegisteredName"]] = f"{len(server.get_central_instances(profile.path))} central instances"
        except pywbem.Error as error:
            found[profile["RegisteredName"]] = str(error)
    return found


def main():
    url, interop = sys.argv[1:3]
    walks = int(sys.argv[3]) if len(sys.argv) > 3 else ASSOCIATION_LIMIT
    user = tuple(sys.argv[4:6]) or None
    connection = pywbem.WBEMConnection(url, user, default_namespace=NAMESPACE, timeout=120)
    walk = Walk(connection, interop, walks)
    walk.walk()
    print(f"{walk.instances} instances, {walk.followed} association walks")
    for name, answer in sorted(profiles(connection).items()):
        print(f"  {name}: {answer}")
    for complaint in walk.complaints:
        print(f"  complaint: {complaint}")
    return 1 if walk.complaints else 0


if __name__ == "__main__":
    sys.exit(main())
