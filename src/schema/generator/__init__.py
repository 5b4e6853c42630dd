"""Reader of the class descriptions and writers of what is generated from them."""
