int own() {
    return 0;
}
